#include "devices/IPPAdditions.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <functional>
#include <string>
#include <vector>

#include "platform/Handles.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

using namespace IPPAdditions;

using Dictionary = PropertyDictionary;

/// An IPP message that holds the attributes of one test.
class Message {
public:
    ipp_attribute_t* texts(const std::vector<const char*>& values, ipp_tag_t tag = IPP_TAG_TEXT) {
        return ippAddStrings(ipp_.get(), IPP_TAG_PRINTER, tag, "texts", static_cast<int>(values.size()),
                             nullptr, values.data());
    }
    ipp_attribute_t* text(const std::string& value, ipp_tag_t tag = IPP_TAG_TEXT) {
        return ippAddString(ipp_.get(), IPP_TAG_PRINTER, tag, "text", nullptr, value.c_str());
    }
    ipp_attribute_t* booleans(const std::vector<char>& values) {
        return ippAddBooleans(ipp_.get(), IPP_TAG_PRINTER, "booleans", static_cast<int>(values.size()),
                              values.data());
    }
    ipp_attribute_t* integer(int value) {
        return ippAddInteger(ipp_.get(), IPP_TAG_PRINTER, IPP_TAG_INTEGER, "integer", value);
    }
    ipp_attribute_t* noValue() {
        return ippAddOutOfBand(ipp_.get(), IPP_TAG_PRINTER, IPP_TAG_NOVALUE, "no-value");
    }
    ipp_attribute_t* separator() { return ippAddSeparator(ipp_.get()); }

private:
    IppPtr ipp_{ippNew()};
};

// Every operation that reads an attribute, by the key "key" where it takes one.
struct NamedOperation {
    std::string_view name;
    std::function<void(Dictionary&, ipp_attribute_t*)> add;
};

const std::vector<NamedOperation>& allOperations() {
    static FakeLog log;
    static const std::array kWanted{std::string_view{"one"}};
    static const std::vector<NamedOperation> operations{
        {"strings", [](auto& to, auto* from) { ippAddStringsFromAttribute(to, from, "key"); }},
        {"string", [](auto& to, auto* from) { ippAddStringFromAttribute(to, from, "key"); }},
        {"string array", [](auto& to, auto* from) { ippAddStringArrayFromAttribute(to, from, "key"); }},
        {"product", [](auto& to, auto* from) { ippAddProductFromAttribute(to, from, "key"); }},
        {"UUID", [](auto& to, auto* from) { ippAddUUIDStringFromAttribute(to, from, "key"); }},
        {"URI", [](auto& to, auto* from) { ippAddURIStringFromAttribute(to, from, "h", 80, "key", log); }},
        {"paper max", [](auto& to, auto* from) { ippAddPaperMaxFromAttribute(to, from); }},
        {"boolean", [](auto& to, auto* from) { ippAddBooleanFromAttribte(to, from, "key"); }},
        {"matching", [](auto& to, auto* from) { ippAddBooleanFromAttribte(to, from, kWanted, "key"); }},
    };
    return operations;
}

TEST(IppAdditions, AddNothingForANullAttribute) {
    const Dictionary before{{"key", "old"}, {"PaperMax", "old"}};
    for (const auto& [name, add] : allOperations()) {
        auto dictionary = before;
        add(dictionary, nullptr);
        EXPECT_EQ(dictionary, before) << name;
    }
}

TEST(IppAdditions, AddNothingForAnAttributeWithoutValues) {
    Message message;
    auto* const attribute = message.separator();
    ASSERT_EQ(ippGetCount(attribute), 0);
    const Dictionary before{{"key", "old"}, {"PaperMax", "old"}};
    for (const auto& [name, add] : allOperations()) {
        auto dictionary = before;
        add(dictionary, attribute);
        EXPECT_EQ(dictionary, before) << name;
    }
}

TEST(IppAdditions, ReplaceTheValueOfTheirOwnKeyAndLeaveTheOthersAlone) {
    Message message;
    Dictionary dictionary{{"key", "old"}, {"other", "stays"}};
    ippAddStringFromAttribute(dictionary, message.text("new"), "key");
    EXPECT_EQ(dictionary, (Dictionary{{"key", "new"}, {"other", "stays"}}));
}

TEST(IppAdditions, TakeNoTextFromAttributesOfAnotherKind) {
    const std::vector<std::string_view> textOperations{"strings", "string", "string array",
                                                       "product", "UUID",   "URI"};
    for (const auto& [name, add] : allOperations()) {
        if (std::ranges::find(textOperations, name) == textOperations.end())
            continue;
        Message message;
        Dictionary dictionary;
        add(dictionary, message.integer(7));
        add(dictionary, message.noValue());
        add(dictionary, message.booleans({1}));
        EXPECT_EQ(dictionary, Dictionary{}) << name;
    }
}

TEST(IppStrings, AreJoinedInOrderWithCommas) {
    const std::vector<std::pair<std::vector<const char*>, std::string>> cases{
        {{"application/pdf", "image/urf"}, "application/pdf,image/urf"},
        {{"image/urf", "application/pdf"}, "image/urf,application/pdf"},
        {{"one"}, "one"},
        {{"a", "", "b"}, "a,,b"},
        {{""}, ""},
        {{"with, comma", "x"}, "with, comma,x"},
    };
    for (const auto& [values, expected] : cases) {
        Message message;
        Dictionary dictionary;
        ippAddStringsFromAttribute(dictionary, message.texts(values), "pdl");
        EXPECT_EQ(dictionary, (Dictionary{{"pdl", expected}})) << expected;
    }
}

TEST(IppStrings, LeaveOutTextsThatAreNotUtf8) {
    Message message;
    Dictionary dictionary;
    ippAddStringsFromAttribute(dictionary, message.texts({"\xff\xfe", "image/urf", "a\xc3"}), "pdl");
    EXPECT_EQ(dictionary, (Dictionary{{"pdl", "image/urf"}}));

    Dictionary nothing;
    ippAddStringsFromAttribute(nothing, message.texts({"\xff"}), "pdl");
    EXPECT_EQ(nothing, Dictionary{});
}

TEST(IppString, IsTheFirstValue) {
    Message message;
    Dictionary dictionary;
    ippAddStringFromAttribute(dictionary, message.texts({"first", "second"}, IPP_TAG_NAME), "display-name");
    EXPECT_EQ(dictionary, (Dictionary{{"display-name", "first"}}));
}

TEST(IppString, KeepsAnEmptyTextAndTextsOfOtherLanguages) {
    for (const std::string value : {"", "Büro 3 – Flur", "印刷機"}) {
        Message message;
        Dictionary dictionary;
        ippAddStringFromAttribute(dictionary, message.text(value), "note");
        EXPECT_EQ(dictionary, (Dictionary{{"note", value}}));
    }
}

TEST(IppString, IsNotTakenWhenTheFirstValueIsNotUtf8) {
    Message message;
    Dictionary dictionary;
    ippAddStringFromAttribute(dictionary, message.texts({"B\xfcro", "Office"}), "note");
    EXPECT_EQ(dictionary, Dictionary{});
}

TEST(IppStringArray, HoldsAllValuesInOrder) {
    Message message;
    Dictionary dictionary;
    ippAddStringArrayFromAttribute(dictionary, message.texts({"b", "a", "b"}), "list");
    EXPECT_EQ(dictionary, (Dictionary{{"list", PropertyArray{"b", "a", "b"}}}));
}

TEST(IppStringArray, IsAListEvenForOneValue) {
    Message message;
    Dictionary dictionary;
    ippAddStringArrayFromAttribute(dictionary, message.text("only"), "list");
    EXPECT_EQ(dictionary, (Dictionary{{"list", PropertyArray{"only"}}}));
}

TEST(IppProduct, IsTheFirstValueInParentheses) {
    const std::vector<std::pair<std::vector<const char*>, std::string>> cases{
        {{"HP LaserJet"}, "(HP LaserJet)"},
        {{"HP LaserJet", "Other"}, "(HP LaserJet)"},
        {{"(HP LaserJet)"}, "((HP LaserJet))"},
        {{""}, "()"},
    };
    for (const auto& [values, expected] : cases) {
        Message message;
        Dictionary dictionary;
        ippAddProductFromAttribute(dictionary, message.texts(values), "product");
        EXPECT_EQ(dictionary, (Dictionary{{"product", expected}})) << values.front();
    }
}

TEST(IppUUID, LosesItsPrefixInLowerCaseOnly) {
    const std::vector<std::pair<std::string, std::string>> cases{
        {"urn:uuid:1234", "1234"},
        {"URN:UUID:1234", "URN:UUID:1234"},
        {"urn:UUID:1234", "urn:UUID:1234"},
        {"1234", "1234"},
        {"urn:uuid", "urn:uuid"},
        {"urn:uuid:", ""},
        {"urn:uuid:urn:uuid:1234", "urn:uuid:1234"},
        {" urn:uuid:1234", " urn:uuid:1234"},
        {"", ""},
    };
    for (const auto& [value, expected] : cases) {
        Message message;
        Dictionary dictionary;
        ippAddUUIDStringFromAttribute(dictionary, message.text(value, IPP_TAG_URI), "UUID");
        EXPECT_EQ(dictionary, (Dictionary{{"UUID", expected}})) << value;
    }
}

TEST(IppBoolean, IsTheFirstValueAsALetter) {
    const std::vector<std::pair<std::vector<char>, std::string>> cases{
        {{1}, "T"}, {{0}, "F"}, {{1, 0}, "T"}, {{0, 1}, "F"}};
    for (const auto& [values, expected] : cases) {
        Message message;
        Dictionary dictionary;
        ippAddBooleanFromAttribte(dictionary, message.booleans(values), "Color");
        EXPECT_EQ(dictionary, (Dictionary{{"Color", expected}})) << values.size() << " values";
    }
}

TEST(IppBoolean, IsFalseForAnAttributeOfAnotherKind) {
    Message message;
    for (auto* attribute : {message.text("true"), message.integer(1)}) {
        Dictionary dictionary;
        ippAddBooleanFromAttribte(dictionary, attribute, "Color");
        EXPECT_EQ(dictionary, (Dictionary{{"Color", "F"}})) << ippGetName(attribute);
    }
}

TEST(IppMatching, IsTrueWhenAnyOfTheTextsIsAmongTheValues) {
    struct Case {
        std::vector<const char*> values;
        std::vector<std::string_view> wanted;
        std::string expected;
    };
    const std::vector<Case> cases{
        {{"one-sided", "two-sided-long-edge"}, {"two-sided-long-edge"}, "T"},
        {{"two-sided-long-edge"}, {"two-sided-long-edge"}, "T"},
        {{"one-sided"}, {"two-sided-long-edge"}, "F"},
        {{"two-sided-short-edge"}, {"two-sided-long-edge"}, "F"},
        {{"two-sided-long-edge-2"}, {"two-sided-long-edge"}, "F"},
        {{"one-sided"}, {"x", "one-sided"}, "T"},
        {{"one-sided"}, {"one-sided", "x"}, "T"},
        {{"one-sided"}, {"x", "y"}, "F"},
        {{"one-sided"}, {}, "F"},
    };
    for (const auto& [values, wanted, expected] : cases) {
        Message message;
        Dictionary dictionary;
        ippAddBooleanFromAttribte(dictionary, message.texts(values, IPP_TAG_KEYWORD), wanted, "Duplex");
        EXPECT_EQ(dictionary, (Dictionary{{"Duplex", expected}})) << values.back() << ", " << wanted.size();
    }
}

}  // namespace
}  // namespace ventras
