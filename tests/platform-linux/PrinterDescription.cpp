#include "tests/platform-linux/PrinterDescription.h"

#include "tests/parts/ScriptedPrinter.h"

namespace ventras {

Description::Description() {
    ippSetVersion(message_.get(), 2, 0);
    ippSetStatusCode(message_.get(), IPP_STATUS_OK);
    ippAddString(message_.get(), IPP_TAG_OPERATION, IPP_TAG_CHARSET, "attributes-charset", nullptr, "utf-8");
    ippAddString(message_.get(), IPP_TAG_OPERATION, IPP_TAG_LANGUAGE, "attributes-natural-language", nullptr,
                 "en");
    ippAddSeparator(message_.get());
    addDriverlessAttributes(message_.get(), {});
}

Description& Description::text(ipp_tag_t tag, const char* name, const std::vector<std::string>& values) {
    removeAttribute(get(), name);
    std::vector<const char*> pointers;
    for (const auto& value : values)
        pointers.push_back(value.c_str());
    ippAddStrings(get(), IPP_TAG_PRINTER, tag, name, static_cast<int>(pointers.size()), nullptr,
                  pointers.data());
    return *this;
}

Description& Description::numbers(ipp_tag_t tag, const char* name, const std::vector<int>& values) {
    removeAttribute(get(), name);
    ippAddIntegers(get(), IPP_TAG_PRINTER, tag, name, static_cast<int>(values.size()), values.data());
    return *this;
}

Description& Description::collections(const char* name, const std::vector<IppPtr>& values) {
    removeAttribute(get(), name);
    std::vector<const ipp_t*> pointers;
    for (const auto& value : values)
        pointers.push_back(value.get());
    ippAddCollections(get(), IPP_TAG_PRINTER, name, static_cast<int>(pointers.size()), pointers.data());
    return *this;
}

IppPtr size(int x, int y) {
    IppPtr collection{ippNew()};
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "x-dimension", x);
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "y-dimension", y);
    return collection;
}

IppPtr media(const IppPtr& mediaSize, const std::string& source, const std::string& type) {
    IppPtr collection{ippNew()};
    ippAddCollection(collection.get(), IPP_TAG_ZERO, "media-size", mediaSize.get());
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_KEYWORD, "media-source", nullptr, source.c_str());
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_KEYWORD, "media-type", nullptr, type.c_str());
    ippAddInteger(collection.get(), IPP_TAG_ZERO, IPP_TAG_INTEGER, "media-top-margin", 300);
    ippAddString(collection.get(), IPP_TAG_ZERO, IPP_TAG_TEXT, "media-info", nullptr, "\"evil");
    return collection;
}

}  // namespace ventras
