#include "devices/TXTRecord.h"

#include <dns_sd.h>
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <string>
#include <vector>

#include "devices/IPPAdditions.h"
#include "platform/Utf8.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

std::string record(const std::vector<std::string>& items) {
    std::string bytes;
    for (const auto& item : items)
        bytes += static_cast<char>(item.size()) + item;
    return bytes;
}

/// A TXT record under construction.
class TXTBuilder {
public:
    TXTBuilder() { TXTRecordCreate(&record_, 0, nullptr); }
    ~TXTBuilder() { TXTRecordDeallocate(&record_); }
    TXTBuilder(const TXTBuilder&) = delete;
    TXTBuilder& operator=(const TXTBuilder&) = delete;

    TXTRecordRef& ref() { return record_; }
    std::string bytes() const {
        return {static_cast<const char*>(TXTRecordGetBytesPtr(&record_)), TXTRecordGetLength(&record_)};
    }

private:
    TXTRecordRef record_{};
};

std::string written(const PropertyDictionary& dictionary) {
    TXTBuilder builder;
    IPPAdditions::txtRecordRepresentation(dictionary, builder.ref());
    return builder.bytes();
}

TEST(TXTRecord, GivesKeysAndValues) {
    EXPECT_EQ(dictionaryFromTXTRecord(record({"txtvers=1", "UUID=12-34", "note=Büro=3"})),
              (DeviceDescription{{"txtvers", "1"}, {"UUID", "12-34"}, {"note", "Büro=3"}}));
}

TEST(TXTRecord, LeavesOutItemsWithoutAValueWithAnEmptyOneAndWithOneThatIsNotUtf8) {
    EXPECT_EQ(dictionaryFromTXTRecord(record({"flag", "empty=", "bad=\xff", "cut=\xc3", "good=1"})),
              (DeviceDescription{{"good", "1"}}));
}

TEST(TXTRecord, KeepsTheLastValueOfAKeyAndTheSpellingOfKeys) {
    EXPECT_EQ(dictionaryFromTXTRecord(record({"a=1", "A=2", "a=3"})),
              (DeviceDescription{{"a", "3"}, {"A", "2"}}));
}

TEST(TXTRecord, DoesNotLetAnEmptyOrWrongItemReplaceAnEarlierOne) {
    EXPECT_EQ(dictionaryFromTXTRecord(record({"a=1", "a=", "a", "a=\xff"})), (DeviceDescription{{"a", "1"}}));
}

TEST(TXTRecord, GivesNothingForNothing) {
    EXPECT_EQ(dictionaryFromTXTRecord(""), DeviceDescription{});
    EXPECT_EQ(dictionaryFromTXTRecord(std::string_view("\0", 1)), DeviceDescription{});
}

TEST(TXTRecord, EndsAtAnItemThatGoesBeyondTheRecord) {
    EXPECT_EQ(dictionaryFromTXTRecord(record({"a=1"}) + "\x09"
                                                        "b=2"),
              (DeviceDescription{{"a", "1"}}));
    EXPECT_EQ(dictionaryFromTXTRecord("\x01"), DeviceDescription{});
    EXPECT_EQ(dictionaryFromTXTRecord("\xff"), DeviceDescription{});
}

TEST(TXTRecord, LongerThanARecordCanBeGivesNothing) {
    std::string tooLong;
    while (tooLong.size() <= 65535)
        tooLong += record({"key=value"});
    EXPECT_EQ(dictionaryFromTXTRecord(tooLong), DeviceDescription{});
}

TEST(TXTRecord, SurvivesRandomBytes) {
    constexpr std::string_view kTypical = "=ab\x03\x05";
    std::mt19937 random(20);
    for (int round = 0; round < 2000; ++round) {
        std::string bytes(random() % 200, '\0');
        for (char& byte : bytes)
            byte = random() % 4 == 0 ? static_cast<char>(random()) : kTypical[random() % kTypical.size()];
        // On the heap and exactly as long as it is told, so that a read past its end shows.
        const std::vector<char> exact(bytes.begin(), bytes.end());
        for (const auto& [key, value] : dictionaryFromTXTRecord({exact.data(), exact.size()})) {
            EXPECT_LT(key.size(), 256U) << round;
            EXPECT_TRUE(!value.empty() && isValidUtf8(value)) << round;
        }
    }
}

TEST(TXTRecordRepresentation, SetsEveryText) {
    EXPECT_EQ(
        dictionaryFromTXTRecord(written({{"UUID", "12"}, {"product", "(HP LaserJet)"}, {"Duplex", "T"}})),
        (DeviceDescription{{"UUID", "12"}, {"product", "(HP LaserJet)"}, {"Duplex", "T"}}));
}

TEST(TXTRecordRepresentation, GoesThroughTheDictionaryInItsOrder) {
    EXPECT_EQ(written({{"b", "2"}, {"a", "1"}}), record({"a=1", "b=2"}));
}

TEST(TXTRecordRepresentation, LeavesOutWhatIsNoText) {
    EXPECT_EQ(written({{"flag", true},
                       {"number", std::int64_t{7}},
                       {"list", PropertyArray{"a"}},
                       {"dictionary", PropertyDictionary{{"a", "b"}}},
                       {"text", "x"}}),
              record({"text=x"}));
}

TEST(TXTRecordRepresentation, SetsAnEmptyTextAsAnEmptyValue) {
    EXPECT_EQ(written({{"note", ""}}), record({"note="}));
}

TEST(TXTRecordRepresentation, CountsCharactersModulo256AsTheLength) {
    struct Case {
        std::string value, expected;
    };
    const std::vector<Case> cases{
        {std::string(300, 'x'), std::string(44, 'x')},
        {std::string(256, 'x'), ""},
        {std::string(257, 'x'), "x"},
        {"Büro", "Bür"},   // four characters, five bytes: the fifth stays behind
        {"äöü", "ä\xc3"},  // the cut goes through a character
    };
    for (const auto& [value, expected] : cases)
        EXPECT_EQ(written({{"k", value}}), record({"k=" + expected})) << value;
}

TEST(TXTRecordRepresentation, GoesOnAfterAKeyThatCannotBeSet) {
    EXPECT_EQ(written({{"", "nameless"}, {"a=b", "equals sign"}, {"z", "1"}}), record({"z=1"}));
}

}  // namespace
}  // namespace ventras
