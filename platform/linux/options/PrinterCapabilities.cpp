#include "platform/linux/options/PrinterCapabilities.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include "platform/linux/options/CapabilityText.h"

namespace ventras {
namespace {

enum class Kind { Name, Tray, Mime, Number, Enumeration, Flag, Resolution, MediaSize, Media, Finishing };

struct Row {
    const char* name;
    Kind kind;
    int least = 0;
    int most = std::numeric_limits<int>::max();
};

constexpr std::size_t kMostValues = 256;
constexpr std::size_t kMostMedia = 4096;  // sizes times trays times types, in real printers up to about 2000
constexpr int kLongestSide = 2'000'000;   // hundredths of a millimetre: rolls of 20 m
constexpr int kWidestMargin = 50'000;
constexpr int kFinestResolution = 9600;

// What a driver is made from: RFC 8011, PWG 5100.1 (finishings), 5100.3 and 5100.7 (media-col), 5100.13,
// 5102.4 (PWG raster), and the "urf" and "pclm" capabilities of driverless printing.
constexpr std::array kPrinterAttributes{
    Row{"document-format-supported", Kind::Mime},
    Row{"urf-supported", Kind::Name},
    Row{"pwg-raster-document-resolution-supported", Kind::Resolution},
    Row{"pwg-raster-document-sheet-back", Kind::Name},
    Row{"pwg-raster-document-type-supported", Kind::Name},
    Row{"pclm-source-resolution-default", Kind::Resolution},
    Row{"pclm-source-resolution-supported", Kind::Resolution},
    Row{"printer-resolution-default", Kind::Resolution},
    Row{"printer-resolution-supported", Kind::Resolution},
    Row{"color-supported", Kind::Flag},
    Row{"print-color-mode-default", Kind::Name},
    Row{"print-color-mode-supported", Kind::Name},
    Row{"output-mode-default", Kind::Name},
    Row{"output-mode-supported", Kind::Name},
    Row{"sides-default", Kind::Name},
    Row{"sides-supported", Kind::Name},
    Row{"media-default", Kind::Name},
    Row{"media-ready", Kind::Name},
    Row{"media-supported", Kind::Name},
    Row{"media-size-supported", Kind::MediaSize},
    Row{"media-col-database", Kind::Media},
    Row{"media-col-default", Kind::Media},
    Row{"media-col-ready", Kind::Media},
    Row{"media-bottom-margin-supported", Kind::Number, 0, kWidestMargin},
    Row{"media-left-margin-supported", Kind::Number, 0, kWidestMargin},
    Row{"media-right-margin-supported", Kind::Number, 0, kWidestMargin},
    Row{"media-top-margin-supported", Kind::Number, 0, kWidestMargin},
    Row{"media-source-supported", Kind::Name},
    Row{"media-type-supported", Kind::Name},
    Row{"output-bin-default", Kind::Name},
    Row{"output-bin-supported", Kind::Name},
    Row{"printer-output-tray", Kind::Tray},
    Row{"finishings-default", Kind::Enumeration, 3},
    Row{"finishings-supported", Kind::Enumeration, 3},
    Row{"finishing-template-supported", Kind::Name},
    Row{"finishings-col-database", Kind::Finishing},
    Row{"print-quality-default", Kind::Enumeration, 3, 5},
    Row{"print-quality-supported", Kind::Enumeration, 3, 5},
    Row{"print-content-optimize-default", Kind::Name},
    Row{"print-content-optimize-supported", Kind::Name},
    Row{"print-rendering-intent-default", Kind::Name},
    Row{"print-rendering-intent-supported", Kind::Name},
    Row{"print-scaling-default", Kind::Name},
    Row{"print-scaling-supported", Kind::Name},
    Row{"job-account-id-supported", Kind::Flag},
    Row{"job-accounting-user-id-supported", Kind::Flag},
    Row{"job-password-supported", Kind::Number, 0, 255},
};

constexpr std::array kMediaMembers{
    Row{"media-size", Kind::MediaSize},
    Row{"media-bottom-margin", Kind::Number, 0, kWidestMargin},
    Row{"media-left-margin", Kind::Number, 0, kWidestMargin},
    Row{"media-right-margin", Kind::Number, 0, kWidestMargin},
    Row{"media-top-margin", Kind::Number, 0, kWidestMargin},
    Row{"media-source", Kind::Name},
    Row{"media-type", Kind::Name},
};

constexpr std::array kSizeMembers{
    Row{"x-dimension", Kind::Number, 1, kLongestSide},
    Row{"y-dimension", Kind::Number, 1, kLongestSide},
};

constexpr std::array kFinishingMembers{Row{"finishing-template", Kind::Name}};

/// Copies what is harmless of one attribute, or of one member of a collection, into a message.
class Copier {
public:
    Copier(ipp_t* to, ipp_tag_t group) : to_(to), group_(group) {}

    void copy(ipp_t* from, std::span<const Row> rows) const {
        for (const auto& row : rows)
            if (auto* attribute = ippFindAttribute(from, row.name, IPP_TAG_ZERO))
                copy(attribute, row);
    }

private:
    void copy(ipp_attribute_t* from, const Row& row) const;
    void copyStrings(ipp_attribute_t* from, const Row& row) const;
    void copyNumbers(ipp_attribute_t* from, const Row& row) const;
    void copyRange(ipp_attribute_t* from, const Row& row) const;
    void copyResolutions(ipp_attribute_t* from, const Row& row) const;
    void copyTrays(ipp_attribute_t* from, const Row& row) const;
    void copyCollections(ipp_attribute_t* from, const Row& row) const;
    void keepIfValid(ipp_attribute_t* added) const;

    ipp_t* to_;
    ipp_tag_t group_;
};

int valueCount(ipp_attribute_t* attribute, std::size_t most = kMostValues) {
    return std::min(ippGetCount(attribute), static_cast<int>(most));
}

bool isString(ipp_tag_t tag) {
    return tag == IPP_TAG_KEYWORD || tag == IPP_TAG_NAME || tag == IPP_TAG_NAMELANG ||
           tag == IPP_TAG_MIMETYPE;
}

bool isMimeType(std::string_view text) {
    const auto slash = text.find('/');
    return slash != std::string_view::npos && isHarmlessName(text.substr(0, slash)) &&
           isHarmlessName(text.substr(text.find('/') + 1));
}

// Numbers stand as integers or as enumerations, whichever the printer's maker thought of.
bool isNumber(ipp_tag_t tag) {
    return tag == IPP_TAG_INTEGER || tag == IPP_TAG_ENUM;
}

// libcups hands out the byte of the message as it is, which need not be a value of the enumeration.
bool isPerInch(const ipp_res_t& unit) {
    std::underlying_type_t<ipp_res_t> number{};
    std::memcpy(&number, &unit, sizeof number);
    return number == IPP_RES_PER_INCH;
}

bool isTrayText(std::string_view text) {
    const auto isHarmless = [](char c) { return c >= ' ' && c <= '~' && c != '"' && c != '\\'; };
    return !text.empty() && text.size() <= 1023 && std::ranges::all_of(text, isHarmless);
}

std::span<const Row> membersOf(Kind kind) {
    switch (kind) {
        case Kind::MediaSize:
            return kSizeMembers;
        case Kind::Media:
            return kMediaMembers;
        case Kind::Finishing:
            return kFinishingMembers;
        default:
            return {};
    }
}

// How many of its members a collection must keep to mean something.
std::size_t memberCount(ipp_t* collection) {
    std::size_t count = 0;
    for (auto* member = ippFirstAttribute(collection); member != nullptr;
         member = ippNextAttribute(collection))
        ++count;
    return count;
}

bool isMeaningful(ipp_t* collection, Kind kind) {
    return memberCount(collection) >= (kind == Kind::MediaSize ? kSizeMembers.size() : 1);
}

void Copier::copy(ipp_attribute_t* from, const Row& row) const {
    switch (row.kind) {
        case Kind::Name:
        case Kind::Mime:
            return copyStrings(from, row);
        case Kind::Tray:
            return copyTrays(from, row);
        case Kind::Number:
        case Kind::Enumeration:
            return ippGetValueTag(from) == IPP_TAG_RANGE ? copyRange(from, row) : copyNumbers(from, row);
        case Kind::Flag:
            if (ippGetValueTag(from) == IPP_TAG_BOOLEAN && ippGetCount(from) > 0)
                keepIfValid(ippAddBoolean(to_, group_, row.name, static_cast<char>(ippGetBoolean(from, 0))));
            return;
        case Kind::Resolution:
            return copyResolutions(from, row);
        case Kind::MediaSize:
        case Kind::Media:
        case Kind::Finishing:
            return copyCollections(from, row);
    }
}

void Copier::keepIfValid(ipp_attribute_t* added) const {
    if (added != nullptr && ippValidateAttribute(added) == 0)
        ippDeleteAttribute(to_, added);
}

void Copier::copyStrings(ipp_attribute_t* from, const Row& row) const {
    const auto tag = ippGetValueTag(from);
    if (!isString(tag))
        return;
    const auto isHarmless = row.kind == Kind::Mime ? isMimeType : isHarmlessName;
    std::vector<const char*> values;
    for (int i = 0; i < valueCount(from); ++i)
        if (const char* value = ippGetString(from, i, nullptr); value != nullptr && isHarmless(value))
            values.push_back(value);
    if (values.empty())
        return;
    const auto cleanTag = row.kind == Kind::Mime   ? IPP_TAG_MIMETYPE
                          : tag == IPP_TAG_KEYWORD ? tag
                                                   : IPP_TAG_NAME;
    keepIfValid(ippAddStrings(to_, group_, cleanTag, row.name, static_cast<int>(values.size()), nullptr,
                              values.data()));
}

void Copier::copyNumbers(ipp_attribute_t* from, const Row& row) const {
    if (!isNumber(ippGetValueTag(from)))
        return;
    std::vector<int> values;
    for (int i = 0; i < valueCount(from); ++i)
        if (const int value = ippGetInteger(from, i); value >= row.least && value <= row.most)
            values.push_back(value);
    const auto tag = row.kind == Kind::Enumeration ? IPP_TAG_ENUM : IPP_TAG_INTEGER;
    if (!values.empty())
        keepIfValid(
            ippAddIntegers(to_, group_, tag, row.name, static_cast<int>(values.size()), values.data()));
}

// A custom size's side, from shortest to longest.
void Copier::copyRange(ipp_attribute_t* from, const Row& row) const {
    int upper = 0;
    const int lower = ippGetRange(from, 0, &upper);
    if (lower >= row.least && lower <= upper && upper <= row.most)
        keepIfValid(ippAddRange(to_, group_, row.name, lower, upper));
}

void Copier::copyResolutions(ipp_attribute_t* from, const Row& row) const {
    if (ippGetValueTag(from) != IPP_TAG_RESOLUTION)
        return;
    std::vector<int> xs;
    std::vector<int> ys;
    for (int i = 0; i < valueCount(from); ++i) {
        int y = 0;
        ipp_res_t unit = IPP_RES_PER_INCH;
        const int x = ippGetResolution(from, i, &y, &unit);
        const auto isPlausible = [](int dots) { return dots > 0 && dots <= kFinestResolution; };
        if (isPerInch(unit) && isPlausible(x) && isPlausible(y)) {
            xs.push_back(x);
            ys.push_back(y);
        }
    }
    if (!xs.empty())
        keepIfValid(ippAddResolutions(to_, group_, row.name, static_cast<int>(xs.size()), IPP_RES_PER_INCH,
                                      xs.data(), ys.data()));
}

// The trays stand in the order of "output-bin-supported"; one that is left out leaves its place empty.
void Copier::copyTrays(ipp_attribute_t* from, const Row& row) const {
    if (ippGetValueTag(from) != IPP_TAG_STRING)
        return;
    ipp_attribute_t* trays = nullptr;
    for (int i = 0; i < valueCount(from); ++i) {
        int length = 0;
        const auto* data = static_cast<const char*>(ippGetOctetString(from, i, &length));
        std::string_view tray(data == nullptr ? "" : data,
                              data == nullptr ? 0 : static_cast<std::size_t>(length));
        if (!isTrayText(tray))
            tray = "";
        if (trays == nullptr)
            trays = ippAddOctetString(to_, group_, row.name, tray.data(), static_cast<int>(tray.size()));
        else
            ippSetOctetString(to_, &trays, i, tray.data(), static_cast<int>(tray.size()));
    }
}

void Copier::copyCollections(ipp_attribute_t* from, const Row& row) const {
    if (ippGetValueTag(from) != IPP_TAG_BEGIN_COLLECTION)
        return;
    std::vector<IppPtr> owners;
    for (int i = 0; i < valueCount(from, kMostMedia); ++i) {
        IppPtr collection{ippNew()};
        Copier(collection.get(), IPP_TAG_ZERO).copy(ippGetCollection(from, i), membersOf(row.kind));
        if (isMeaningful(collection.get(), row.kind))
            owners.push_back(std::move(collection));
    }
    if (owners.empty())
        return;
    std::vector<const ipp_t*> values;
    std::ranges::transform(owners, std::back_inserter(values), &IppPtr::get);
    keepIfValid(ippAddCollections(to_, group_, row.name, static_cast<int>(values.size()), values.data()));
}

// URF without a resolution is no format to print in, and the PPD generator leaks memory over it.
void dropUnusableUrf(ipp_t* capabilities) {
    auto* urf = ippFindAttribute(capabilities, "urf-supported", IPP_TAG_ZERO);
    for (int i = 0; urf != nullptr && i < ippGetCount(urf); ++i)
        if (std::string_view(ippGetString(urf, i, nullptr)).starts_with("RS"))
            return;
    if (urf != nullptr)
        ippDeleteAttribute(capabilities, urf);
}

void addModel(ipp_t* to, ipp_t* from) {
    auto* attribute = ippFindAttribute(from, "printer-make-and-model", IPP_TAG_TEXT);
    const char* text = attribute == nullptr ? nullptr : ippGetString(attribute, 0, nullptr);
    if (const auto model = harmlessModel(text == nullptr ? "" : text); !model.empty())
        ippAddString(to, IPP_TAG_PRINTER, IPP_TAG_TEXT, "printer-make-and-model", nullptr, model.c_str());
}

}  // namespace

IppPtr printerCapabilities(ipp_t* description, PrinterService service) {
    IppPtr capabilities{ippNewResponse(description)};
    Copier(capabilities.get(), IPP_TAG_PRINTER).copy(description, kPrinterAttributes);
    dropUnusableUrf(capabilities.get());
    addModel(capabilities.get(), description);
    if (service == PrinterService::FaxOut) {
        ippAddString(capabilities.get(), IPP_TAG_PRINTER, IPP_TAG_KEYWORD, "ipp-features-supported", nullptr,
                     "faxout");
        ippAddString(capabilities.get(), IPP_TAG_PRINTER, IPP_TAG_URI, "printer-uri-supported", nullptr,
                     "ipp://localhost/ipp/faxout");
    }
    return capabilities;
}

}  // namespace ventras
