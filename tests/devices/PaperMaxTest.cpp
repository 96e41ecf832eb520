#include <gtest/gtest.h>

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "devices/IPPAdditions.h"
#include "platform/Handles.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

using Range = std::pair<int, int>;

// One media size; a dimension is fixed, a range, or absent. In hundredths of a millimetre.
struct Size {
    std::optional<Range> width = {}, length = {};
    std::optional<int> fixedWidth = {}, fixedLength = {};
};

void addDimension(ipp_t* size, const char* name, const std::optional<Range>& range,
                  const std::optional<int>& fixed) {
    if (range)
        ippAddRange(size, IPP_TAG_ZERO, name, range->first, range->second);
    if (fixed)
        ippAddInteger(size, IPP_TAG_ZERO, IPP_TAG_INTEGER, name, *fixed);
}

std::string paperMax(const std::vector<Size>& sizes) {
    std::vector<IppPtr> owners;
    std::vector<const ipp_t*> collections;
    for (const auto& size : sizes) {
        owners.emplace_back(ippNew());
        collections.push_back(owners.back().get());
        addDimension(owners.back().get(), "x-dimension", size.width, size.fixedWidth);
        addDimension(owners.back().get(), "y-dimension", size.length, size.fixedLength);
    }
    const IppPtr message{ippNew()};
    auto* const attribute = ippAddCollections(message.get(), IPP_TAG_PRINTER, "media-size-supported",
                                              static_cast<int>(collections.size()), collections.data());
    PropertyDictionary dictionary;
    IPPAdditions::ippAddPaperMaxFromAttribute(dictionary, attribute);
    const auto* found = findText(dictionary, "PaperMax");
    return found == nullptr || dictionary.size() != 1 ? "(none)" : *found;
}

std::string paperMax(int width, int length) {
    return paperMax({Size{.width = Range{0, width}, .length = Range{0, length}}});
}

TEST(PaperMax, ClassifiesTheLargestCustomSize) {
    struct Case {
        int width, length;
        std::string_view expected;
    };
    constexpr Case kCases[] = {
        {22859, 99999, "<legal-A4"},  {22860, 35560, "legal-A4"},
        {22860, 1, "legal-A4"},       {33019, 99999, "legal-A4"},
        {33020, 48259, "legal-A4"},   {99999, 48259, "legal-A4"},
        {33020, 48260, "tabloid-A3"}, {45719, 99999, "tabloid-A3"},
        {99999, 60959, "tabloid-A3"}, {45720, 60960, "isoC-A2"},
        {45720, 99999, "isoC-A2"},    {99999, 60960, "isoC-A2"},
        {45721, 60961, ">isoC-A2"},   {2147483647, 2147483647, ">isoC-A2"},
        {0, 0, "<legal-A4"},          {-5, -5, "<legal-A4"},
    };
    for (const auto& [width, length, expected] : kCases)
        EXPECT_EQ(paperMax(width, length), expected) << width << " x " << length;
}

TEST(PaperMax, TakesTheLargestWidthAndTheLargestLengthOfAllSizes) {
    const Size wide{.width = Range{100, 45721}, .length = Range{100, 200}};
    const Size tall{.width = Range{100, 200}, .length = Range{100, 60961}};
    EXPECT_EQ(paperMax({wide, tall}), ">isoC-A2");
    EXPECT_EQ(paperMax({tall, wide}), ">isoC-A2");
    EXPECT_EQ(paperMax({tall}), "<legal-A4");
}

TEST(PaperMax, CountsTheUpperBoundOfARange) {
    EXPECT_EQ(paperMax({Size{.width = Range{45721, 45721}, .length = Range{60961, 60961}}}), ">isoC-A2");
    EXPECT_EQ(paperMax({Size{.width = Range{45721, 1}, .length = Range{60961, 1}}}), "<legal-A4");
}

TEST(PaperMax, IgnoresFixedSizes) {
    EXPECT_EQ(paperMax({Size{.fixedWidth = 99999, .fixedLength = 99999}}), "<legal-A4");
    EXPECT_EQ(paperMax({Size{.width = Range{0, 99999}, .fixedLength = 99999}}), "legal-A4");
}

TEST(PaperMax, IsTheSmallestClassForSizesWithoutDimensions) {
    EXPECT_EQ(paperMax({Size{}}), "<legal-A4");
}

TEST(PaperMax, IsTheSmallestClassForAnAttributeThatHoldsNoSizes) {
    const IppPtr message{ippNew()};
    PropertyDictionary dictionary;
    IPPAdditions::ippAddPaperMaxFromAttribute(
        dictionary,
        ippAddInteger(message.get(), IPP_TAG_PRINTER, IPP_TAG_INTEGER, "media-size-supported", 99999));
    EXPECT_EQ(dictionary, (PropertyDictionary{{"PaperMax", "<legal-A4"}}));
}

}  // namespace
}  // namespace ventras
