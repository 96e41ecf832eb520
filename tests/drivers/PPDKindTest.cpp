#include "drivers/PPDKind.h"

#include <gtest/gtest.h>

#include "drivers/PPDManager.h"

namespace ventras {
namespace {

using Languages = std::vector<std::string>;

struct NameCase {
    std::string name;
    unsigned localized, plain;
};

TEST(PPDKindOfARecord, ComesFromItsNameAndLanguages) {
    const std::vector<NameCase> cases{
        {"/x/Vellum.ppd", 1, 1},
        {"drv:///sample.drv/Vellum.ppd", 1, 1},
        {"/hpijs/Vellum.ppd", 1, 1},
        {"/x/vellum.ppd", 2, 3},
        {"/x/Vellum.ppd.gz", 2, 3},
        {"/x/HPIJS-a.ppd", 6, 6},
        {"drv:///Library/hpIjs", 6, 6},
        {"/x", 2, 3},
        {"drv:///Library/x", 2, 3},
        {"drvr:///Library/x", 2, 3},
        {"quillon://Scanner/x", 2, 3},
        {"Library/Printers/x", 2, 3},
        {"file://Library/Printers/x", 2, 3},
        {"file:///Library/Printers/x", 2, 3},
        {"System/Library/Printers/PPDs/x", 2, 3},
        {"file://System/Library/Printers/PPDs/x", 2, 3},
        {"file:///System/Library/Printers/PPDs/x", 2, 3},
        {"drv:///sample.drv/generic.ppd", 7, 8},
        {"drv:///sample.drv/hpijs.ppd", 7, 8},
        {"library/Printers/x", 7, 8},
        {"DRV:///Library/x", 7, 8},
        {"Library/Printer", 7, 8},
        {"System/Library/Printers/x", 7, 8},
        {"file:///usr/x.ppd", 7, 8},
        {"x/Library/Printers/x", 7, 8},
        {"", 7, 8},
    };
    for (const auto& [name, localized, plain] : cases) {
        PPDRecord record;
        record.name = name;
        EXPECT_EQ(PPDManager::ppdKind(record), plain) << name;
        record.naturalLanguage = Languages{};
        EXPECT_EQ(PPDManager::ppdKind(record), plain) << name;
        record.naturalLanguage = Languages{""};
        EXPECT_EQ(PPDManager::ppdKind(record), localized) << name;
    }
}

TEST(PPDKindOfARecord, IsTheWorstWithoutARecord) {
    EXPECT_EQ(PPDManager::ppdKind(std::nullopt), 10U);
    EXPECT_EQ(PPDManager::ppdKind(PPDRecord{}), 8U);
}

TEST(PPDKindOfARecord, IsDecidedByTheFirstRuleThatApplies) {
    PPDRecord record;
    record.name = "/x/Vellum.ppd";
    record.naturalLanguage = Languages{"en"};
    EXPECT_EQ(PPDManager::ppdKind(record), 1U);

    record.secureVellum = false;
    EXPECT_EQ(PPDManager::ppdKind(record), 1U);
    record.secureVellum = true;
    EXPECT_EQ(PPDManager::ppdKind(record), 0U);

    record.filters = {"a/a 0 A", "application/Tioga 0 - "};
    EXPECT_EQ(PPDManager::ppdKind(record), 0U);
    record.filters.emplace_back("application/Tioga 0 -");
    EXPECT_EQ(PPDManager::ppdKind(record), 9U);

    record.suDriverConflicts = PropertyArray{};
    EXPECT_EQ(PPDManager::ppdKind(record), 9U);
    record.suDriverPredicate = "MFG:a;MDL:b;";
    EXPECT_EQ(PPDManager::ppdKind(record), 5U);
    record.suDriverConflicts.reset();
    EXPECT_EQ(PPDManager::ppdKind(record), 4U);
}

struct TypeCase {
    std::optional<std::string> type;
    bool fax, postscript, raster;
};

TEST(PPDType, OfARecordThatNamesNoneIsEverythingButFax) {
    const std::vector<TypeCase> cases{
        {std::nullopt, false, true, true}, {"fax", true, false, false},   {"postscript", false, true, false},
        {"raster", false, false, true},    {"Fax", false, false, false},  {"RASTER", false, false, false},
        {"", false, false, false},         {"scan", false, false, false},
    };
    for (const auto& [type, fax, postscript, raster] : cases) {
        PPDRecord record;
        record.type = type;
        EXPECT_EQ(PPDManager::isFaxPPD(record), fax) << type.value_or("none");
        EXPECT_EQ(PPDManager::isPostscriptPPD(record), postscript) << type.value_or("none");
        EXPECT_EQ(PPDManager::isRasterPPD(record), raster) << type.value_or("none");
    }
}

}  // namespace
}  // namespace ventras
