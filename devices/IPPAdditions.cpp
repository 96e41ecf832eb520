#include "devices/IPPAdditions.h"

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <vector>

#include "deviceid/TextScan.h"
#include "platform/Log.h"
#include "platform/Utf8.h"

namespace ventras::IPPAdditions {
namespace {

constexpr std::string_view kUUIDPrefix = "urn:uuid:";
constexpr int kSmallestWidth = 21590;
constexpr int kSmallestLength = 35560;

struct SizeClass {
    int width, length;  // a size below either is of this class
    std::string_view name;
};

constexpr std::array kSizeClasses{
    SizeClass{22860, 35560, "<legal-A4"},
    SizeClass{33020, 48260, "legal-A4"},
    SizeClass{45720, 60960, "tabloid-A3"},
};

std::string_view paperMax(int width, int length) {
    for (const auto& sizeClass : kSizeClasses)
        if (width < sizeClass.width || length < sizeClass.length)
            return sizeClass.name;
    const auto& largest = kSizeClasses.back();
    return width > largest.width && length > largest.length ? ">isoC-A2" : "isoC-A2";
}

std::optional<std::string> text(ipp_attribute_t* attribute, int index) {
    const char* value = ippGetString(attribute, index, nullptr);
    return value != nullptr && isValidUtf8(value) ? std::optional<std::string>{value} : std::nullopt;
}

std::optional<std::string> firstText(ipp_attribute_t* attribute) {
    return ippGetCount(attribute) < 1 ? std::nullopt : text(attribute, 0);
}

std::vector<std::string> texts(ipp_attribute_t* attribute) {
    std::vector<std::string> values;
    for (int i = 0; i < ippGetCount(attribute); ++i)
        if (auto value = text(attribute, i))
            values.push_back(std::move(*value));
    return values;
}

void set(PropertyDictionary& dictionary, std::string_view key, PropertyValue value) {
    dictionary.insert_or_assign(std::string(key), std::move(value));
}

void setBoolean(PropertyDictionary& dictionary, std::string_view key, bool value) {
    set(dictionary, key, value ? "T" : "F");
}

int upperBound(ipp_t* size, const char* dimension) {
    int upper = 0;
    if (auto* range = ippFindAttribute(size, dimension, IPP_TAG_RANGE))
        ippGetRange(range, 0, &upper);
    return upper;
}

}  // namespace

void ippAddStringsFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                std::string_view key) {
    const auto values = texts(attribute);
    if (values.empty())
        return;
    std::string joined = values.front();
    for (auto value = values.begin() + 1; value != values.end(); ++value)
        joined.append(",").append(*value);
    set(dictionary, key, std::move(joined));
}

void ippAddStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::string_view key) {
    if (auto value = firstText(attribute))
        set(dictionary, key, std::move(*value));
}

void ippAddStringArrayFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                    std::string_view key) {
    const auto values = texts(attribute);
    if (!values.empty())
        set(dictionary, key, PropertyArray(values.begin(), values.end()));
}

void ippAddProductFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                std::string_view key) {
    if (const auto value = firstText(attribute))
        set(dictionary, key, "(" + *value + ")");
}

void ippAddUUIDStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                   std::string_view key) {
    const auto value = firstText(attribute);
    if (!value)
        return;
    const bool isPrefixed = value->starts_with(kUUIDPrefix);
    set(dictionary, key, value->substr(isPrefixed ? kUUIDPrefix.size() : 0));
}

void ippAddURIStringFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                                  std::string_view host, std::int32_t port, std::string_view key, Log& log) {
    const auto value = firstText(attribute);
    if (!value)
        return;
    std::array<char, 16> scheme{};
    std::array<char, 256> user{}, parsedHost{}, resource{};
    int parsedPort = 0;
    const auto status = httpSeparateURI(HTTP_URI_CODING_ALL, value->c_str(), scheme.data(), scheme.size(),
                                        user.data(), user.size(), parsedHost.data(), parsedHost.size(),
                                        &parsedPort, resource.data(), resource.size());
    if (status != HTTP_URI_STATUS_OK && status != HTTP_URI_STATUS_MISSING_RESOURCE)
        return;
    const std::string hostName(host);
    if (!host.empty() && TextScan::findIgnoringCase(parsedHost.data(), host) == std::string_view::npos) {
        log.error("Attr:printer-more-info incorrect host ('" + std::string(parsedHost.data()) +
                  "', must contain " + hostName + ") - Unsupported adminURL\n");
        return;
    }
    if (parsedPort != port) {
        log.error("Attr:printer-more-info incorrect port number (" + std::to_string(parsedPort) +
                  ", must be " + std::to_string(port) + ") - Unsupported adminURL\n");
        return;
    }
    std::array<char, 1024> uri{};
    if (httpAssembleURI(HTTP_URI_CODING_ALL, uri.data(), uri.size(), scheme.data(), nullptr, hostName.c_str(),
                        port, resource.data()) == HTTP_URI_STATUS_OK)
        set(dictionary, key, uri.data());
}

void ippAddPaperMaxFromAttribute(PropertyDictionary& dictionary, ipp_attribute_t* attribute) {
    if (ippGetCount(attribute) < 1)
        return;
    int width = kSmallestWidth;
    int length = kSmallestLength;
    for (int i = 0; i < ippGetCount(attribute); ++i) {
        ipp_t* size = ippGetCollection(attribute, i);
        width = std::max(width, upperBound(size, "x-dimension"));
        length = std::max(length, upperBound(size, "y-dimension"));
    }
    set(dictionary, "PaperMax", paperMax(width, length));
}

void ippAddBooleanFromAttribte(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::string_view key) {
    if (ippGetCount(attribute) >= 1)
        setBoolean(dictionary, key, ippGetBoolean(attribute, 0) != 0);
}

void ippAddBooleanFromAttribte(PropertyDictionary& dictionary, ipp_attribute_t* attribute,
                               std::span<const std::string_view> matching, std::string_view key) {
    if (ippGetCount(attribute) < 1)
        return;
    const auto isContained = [attribute](std::string_view value) {
        return ippContainsString(attribute, std::string(value).c_str()) != 0;
    };
    setBoolean(dictionary, key, std::ranges::any_of(matching, isContained));
}

void txtRecordRepresentation(const PropertyDictionary& dictionary, TXTRecordRef& record) {
    for (const auto& [key, value] : dictionary)
        if (const auto* content = std::get_if<std::string>(&value))
            TXTRecordSetValue(&record, key.c_str(), static_cast<std::uint8_t>(characterCount(*content)),
                              content->data());
}

}  // namespace ventras::IPPAdditions
