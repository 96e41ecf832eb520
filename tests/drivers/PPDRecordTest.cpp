#include "drivers/PPDRecord.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

PropertyDictionary everyKey() {
    return {
        {"ppd_name", "/a.ppd"},
        {"ppd_make", "Acme"},
        {"ppd_make_and_model", "Acme Jet"},
        {"ppd_product", PropertyArray{"(Jet)", "Jet"}},
        {"ppd_device_id", "MFG:Acme;"},
        {"ppd_model_number", "7"},
        {"ppd_type", "fax"},
        {"ppd_filters", PropertyArray{"a/a 0 A"}},
        {"ppd_natural_language", PropertyArray{"en"}},
        {"ppd_language_level", std::int64_t{3}},
        {"ppd_color", true},
        {"ppd_throughput", std::int64_t{12}},
        {"ppd_file_version", "1"},
        {"ppd_language_version", "English"},
        {"ppd_iconpath", "/i"},
        {"ppd_inktool", "/t"},
        {"ppd_cups_commands", "Clean"},
        {"ppd_psversion", PropertyArray{"(3010) 0"}},
        {"ppd_pdes", PropertyArray{"/p"}},
        {"ppd_secure_vellum", true},
        {"KioskoSUDriverPredicateStr", "MFG:Acme;"},
        {"kKioskoSUDriverConflicts", PropertyDictionary{{"a", true}}},
        {"KioskoSUCacheCurrent", false},
        {"KioskoDriverName", "Jet driver"},
    };
}

TEST(PPDRecordAsDictionary, HasAKeyForEveryField) {
    const auto record = recordFromDictionary(everyKey());
    EXPECT_EQ(record.name, "/a.ppd");
    EXPECT_EQ(record.product, (std::vector<std::string>{"(Jet)", "Jet"}));
    EXPECT_EQ(record.secureVellum, true);
    EXPECT_EQ(dictionaryFromRecord(record), everyKey());
}

TEST(PPDRecordAsDictionary, LeavesOutWhatIsNotKnown) {
    EXPECT_TRUE(dictionaryFromRecord({}).empty());
    EXPECT_EQ(recordFromDictionary({}), PPDRecord{});

    PPDRecord record;
    record.naturalLanguage.emplace();
    EXPECT_EQ(dictionaryFromRecord(record), (PropertyDictionary{{"ppd_natural_language", PropertyArray{}}}));
    EXPECT_EQ(recordFromDictionary(dictionaryFromRecord(record)), record);
}

TEST(PPDRecordAsDictionary, PassesOverWhatItCannotHold) {
    EXPECT_EQ(recordFromDictionary({{"ppd_name", true},
                                    {"ppd_color", "yes"},
                                    {"ppd_throughput", "3"},
                                    {"ppd_product", "(Jet)"},
                                    {"ppd_natural_language", "en"},
                                    {"ppd-name", "x"},
                                    {"other", "x"}}),
              PPDRecord{});
    EXPECT_EQ(recordFromDictionary({{"ppd_product", PropertyArray{true, "(Jet)", PropertyArray{}}}}).product,
              std::vector<std::string>{"(Jet)"});
}

}  // namespace
}  // namespace ventras
