#include "platform/PropertyList.h"

#include <gtest/gtest.h>

#include <limits>
#include <random>

namespace ventras {
namespace {

using namespace std::string_literals;

constexpr const char* kHeader = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n";

std::string document(const std::string& content) {
    return kHeader + content + "\n</plist>\n";
}

TEST(PropertyList, ReadsBackWhatItWrites) {
    const PropertyValue values[] = {
        true,
        false,
        std::int64_t{0},
        std::int64_t{42},
        std::int64_t{-1},
        std::numeric_limits<std::int64_t>::max(),
        std::numeric_limits<std::int64_t>::min(),
        "",
        "plain",
        "é € 😀",
        "<&>\"'",
        "  blanks  ",
        "two\nlines\tand a tab",
        PropertyArray{},
        PropertyArray{"one", true, std::int64_t{3}},
        PropertyDictionary{},
        PropertyDictionary{{"key", "value"},
                           {"kéy & <co>", PropertyArray{PropertyDictionary{{"deep", false}}}}},
    };
    for (const auto& value : values) {
        const auto xml = xmlPropertyList(value);
        ASSERT_TRUE(xml) << "value of kind " << value.index();
        const auto read = parsePropertyList(*xml);
        ASSERT_TRUE(read) << *xml;
        EXPECT_EQ(*read, value) << *xml;
    }
}

TEST(PropertyList, WritesXml) {
    const auto xml =
        xmlPropertyList(PropertyDictionary{{"PrinterName", "A & B"}, {"Count", std::int64_t{-7}}});
    ASSERT_TRUE(xml);
    EXPECT_TRUE(xml->starts_with("<?xml version=\"1.0\"")) << *xml;
    EXPECT_NE(xml->find("<key>PrinterName</key>"), std::string::npos) << *xml;
    EXPECT_NE(xml->find("<string>A &amp; B</string>"), std::string::npos) << *xml;
    EXPECT_NE(xml->find("<integer>-7</integer>"), std::string::npos) << *xml;
}

TEST(PropertyList, WritesNothingThatXmlCannotHold) {
    const std::string texts[] = {"bell\a",  "escape\x1b[0m", "bad \xff byte",
                                 "caf\xe9", "cut \xc3",      "zero\0byte"s};
    for (const auto& text : texts) {
        EXPECT_FALSE(xmlPropertyList(text)) << testing::PrintToString(text);
        EXPECT_FALSE(xmlPropertyList(PropertyArray{"good", text})) << testing::PrintToString(text);
        EXPECT_FALSE(xmlPropertyList(PropertyDictionary{{"key", text}})) << testing::PrintToString(text);
        EXPECT_FALSE(xmlPropertyList(PropertyDictionary{{text, "value"}})) << testing::PrintToString(text);
    }
}

TEST(PropertyList, LeavesOutWhatItDoesNotKnow) {
    const auto value = parsePropertyList(
        document("<dict><key>when</key><date>2020-01-01T00:00:00Z</date><key>real</key><real>1.5</real>"
                 "<key>data</key><data>AAAA</data><key>text</key><string>kept</string>"
                 "<key>list</key><array><real>2.5</real><true/></array></dict>"));
    ASSERT_TRUE(value);
    EXPECT_EQ(*value, (PropertyValue{PropertyDictionary{{"text", "kept"}, {"list", PropertyArray{true}}}}));
}

TEST(PropertyList, RefusesTheBinaryForm) {
    const std::string inputs[] = {
        // {"a": true}
        "bplist00\xd1\x01\x02\x51\x61\x09\x08\x0b\x0d\0\0\0\0\0\0\x01\x01\0\0\0\0\0"
        "\0\0\x03\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\x0e"s,
        // {"a\0b": true}, the key in UTF-16
        "bplist00\xd1\x01\x02\x63\0\x61\0\0\0\x62\x09\x08\x0b\x12\0\0\0\0\0\0\x01\x01\0\0\0\0\0"
        "\0\0\x03\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\x13"s,
        "bplist00",
        "bplist00"s + std::string(40, '\xff'),
        "bplist<plist><true/></plist>",
    };
    for (const auto& input : inputs)
        EXPECT_FALSE(parsePropertyList(input)) << testing::PrintToString(input);
}

TEST(PropertyList, RefusesWhatDoesNotParse) {
    const std::string inputs[] = {
        "",
        " ",
        "plain text",
        "<",
        "<plist>",
        "<plist version=\"1.0\"><dict>",
        document("<dict><key>no value</key></dict>").substr(0, 70),
        "<html><body>a web page</body></html>",
    };
    for (const auto& input : inputs)
        EXPECT_FALSE(parsePropertyList(input)) << testing::PrintToString(input);
}

std::string nestedXml(int depth) {
    std::string nested;
    for (int i = 0; i < depth; ++i)
        nested += "<array>";
    return document(nested);
}

// How deep a value goes: 0 for one that holds nothing.
int depthOf(const PropertyValue& value) {
    int depth = 0;
    const auto* array = std::get_if<PropertyArray>(&value);
    for (; array != nullptr && !array->empty(); array = std::get_if<PropertyArray>(&array->front()))
        ++depth;
    return depth;
}

TEST(PropertyList, DoesNotFollowEndlessNesting) {
    for (const int depth : {100, 1000, 10'000, 70'000, 200'000, 1'000'000}) {
        const auto xml = parsePropertyList(nestedXml(depth));
        EXPECT_TRUE(!xml || depthOf(*xml) <= 64) << depth;
    }
}

TEST(PropertyList, ReadsListsOfThousands) {
    PropertyArray queues;
    for (int i = 0; i < 2000; ++i) {
        PropertyDictionary queue;
        queue["printer-name"] = "Queue " + std::to_string(i);
        queue["device-uri"] = "ipp://printer.example/ipp/print";
        queues.emplace_back(std::move(queue));
    }
    const auto xml = xmlPropertyList(queues);
    ASSERT_TRUE(xml);
    EXPECT_EQ(parsePropertyList(*xml), PropertyValue{queues});
}

TEST(PropertyList, ReadsALongListOfTexts) {
    const PropertyArray tags(20'000, "MANUFACTURER:HP;MODEL:Color LaserJet Professional 4");
    const auto xml = xmlPropertyList(tags);
    ASSERT_TRUE(xml);
    EXPECT_GT(xml->size(), 1024U * 1024U);
    EXPECT_EQ(parsePropertyList(*xml), PropertyValue{tags});
}

TEST(PropertyList, RefusesANul) {
    for (const auto& nul : {"\0"s, "&#0;"s, "&#x0;"s, "&#x00000;"s}) {
        EXPECT_FALSE(parsePropertyList(document("<string>a" + nul + "b</string>"))) << nul;
        EXPECT_FALSE(parsePropertyList(document("<dict><key>a" + nul + "b</key><true/></dict>"))) << nul;
    }
}

TEST(PropertyList, RefusesWhatIsTooLong) {
    const auto xml = xmlPropertyList(std::string(std::size_t{4} * 1024 * 1024, 'x'));
    ASSERT_TRUE(xml);
    EXPECT_FALSE(parsePropertyList(*xml));
}

TEST(PropertyList, KeepsReasonableNesting) {
    PropertyValue value = "kernel";
    for (int i = 0; i < 50; ++i)
        value = PropertyArray{value};
    const auto xml = xmlPropertyList(value);
    ASSERT_TRUE(xml);
    EXPECT_EQ(parsePropertyList(*xml), value);
}

TEST(PropertyList, SurvivesAnyDamage) {
    const auto good = *xmlPropertyList(PropertyDictionary{{"one", PropertyArray{"a", true, std::int64_t{5}}},
                                                          {"two", PropertyDictionary{{"b", "c"}}}});
    std::mt19937 random(11);
    for (int round = 0; round < 2000; ++round) {
        auto damaged = good;
        for (unsigned i = 0; i <= random() % 4; ++i)
            damaged[random() % damaged.size()] = static_cast<char>(random());
        damaged.resize(damaged.size() - random() % 20);
        if (const auto value = parsePropertyList(damaged)) {
            // What can be read can be looked at, whatever it has become.
            EXPECT_LT(value->index(), std::variant_size_v<PropertyValue::variant>) << damaged;
        }
    }
}

}  // namespace
}  // namespace ventras
