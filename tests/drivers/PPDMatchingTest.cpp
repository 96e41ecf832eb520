#include "drivers/PPDMatching.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <random>
#include <sstream>

#include "bench/NaiveMatching.h"
#include "deviceid/PMStringAdditions.h"
#include "drivers/PPDManager.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Text = std::optional<std::string>;
using Reason = std::optional<MatchReason>;

constexpr auto kNone = std::nullopt;

template <typename Value>
PPDRecord recordWith(Value PPDRecord::*field, Value value) {
    PPDRecord record;
    record.*field = std::move(value);
    return record;
}

PPDRecord productRecord(std::vector<std::string> products) {
    return recordWith(&PPDRecord::product, std::move(products));
}

PPDRecord idRecord(const std::string& deviceID) {
    return recordWith(&PPDRecord::deviceID, Text(deviceID));
}

PPDRecord numberRecord(const std::string& modelNumber) {
    return recordWith(&PPDRecord::modelNumber, Text(modelNumber));
}

PPDRecord nameRecord(const std::string& makeAndModel, const std::string& name = "drv:///a.drv/a.ppd") {
    auto record = recordWith(&PPDRecord::makeAndModel, Text(makeAndModel));
    record.name = name;
    return record;
}

struct MatchCase {
    Text deviceID, model, product;
    PPDRecord record;
    Reason expected;
};

void expectEach(const std::vector<MatchCase>& cases) {
    for (std::size_t i = 0; i < cases.size(); ++i) {
        const auto& [deviceID, model, product, record, expected] = cases[i];
        EXPECT_EQ(DeviceToMatch(deviceID, model, product).match(record), expected)
            << "row " << i << ": device ID '" << deviceID.value_or("none") << "', model '"
            << model.value_or("none") << "', product '" << product.value_or("none") << "'";
    }
}

TEST(DriverMatch, ComparesEachOfItsProductsWithEverythingThatTheDeviceSays) {
    const std::string id = "MFG:HP;MDL:DeskJet 500;";
    expectEach({
        {kNone, kNone, "(DeskJet 500)", productRecord({"x", "(deskjet 500)"}), MatchReason::product},
        {kNone, kNone, "(DeskJet 500)", productRecord({"DESKJET 500"}), MatchReason::product},
        {kNone, kNone, "DeskJet 500", productRecord({"DESKJET 500"}), MatchReason::product},
        {kNone, kNone, "DeskJet 500", productRecord({"(DeskJet 500)"}), kNone},
        {id, kNone, kNone, productRecord({"(HP DeskJet 500)"}), MatchReason::product},
        {id, kNone, kNone, productRecord({"HP DeskJet 500"}), MatchReason::product},
        {id, kNone, kNone, productRecord({"DeskJet 500"}), MatchReason::product},
        {id, kNone, kNone, productRecord({"(DeskJet 500)"}), kNone},
        {kNone, "DeskJet 500", kNone, productRecord({"deskjet 500"}), MatchReason::product},
        {kNone, "(DeskJet 500)", kNone, productRecord({"DeskJet 500"}), kNone},
        {kNone, "DeskJet 50", kNone, productRecord({"DeskJet 500"}), kNone},
        {kNone, "DeskJet 5000", kNone, productRecord({"DeskJet 500"}), kNone},
    });
}

TEST(DriverMatch, TakesParenthesesOffOnlyWhereThereIsSomethingBetween) {
    expectEach({
        {kNone, kNone, "(a)", productRecord({"a"}), MatchReason::product},
        {kNone, kNone, "()", productRecord({""}), kNone},
        {kNone, kNone, "(", productRecord({""}), kNone},
        {kNone, kNone, "()", productRecord({"()"}), MatchReason::product},
        {kNone, kNone, "(a", productRecord({"a"}), kNone},
        {kNone, kNone, "a)", productRecord({"a"}), kNone},
        {kNone, kNone, "((a))", productRecord({"(a)"}), MatchReason::product},
    });
}

TEST(DriverMatch, PassesOverEmptyProductsAndEmptyTexts) {
    expectEach({
        {kNone, "", kNone, productRecord({""}), kNone},
        {"", "", "", productRecord({"", "/"}), kNone},
        {kNone, "a", kNone, productRecord({"", "a"}), MatchReason::product},
        {kNone, "", kNone, nameRecord(""), kNone},
        {kNone, "", kNone, nameRecord("a", "gutenprint"), kNone},
        {kNone, "", kNone, numberRecord(""), kNone},
        {"", "", "", idRecord(""), kNone},
    });
}

TEST(DriverMatch, ReadsTheSlashesOfAProductAsSpaces) {
    const auto record = productRecord({"LaserJet 4/4M"});
    constexpr auto kSlashes = MatchReason::productWithSlashes;
    expectEach({
        {"MFG:HP;MDL:LaserJet 4 4M;", kNone, kNone, record, kSlashes},
        {"product:laserjet 4 4m;", kNone, kNone, record, kSlashes},
        {"product:(LaserJet 4 4M);", kNone, kNone, record, kSlashes},
        {kNone, "LASERJET 4 4M", kNone, record, kSlashes},
        {kNone, kNone, "LaserJet 4 4M", record, kSlashes},
        {kNone, kNone, "(LaserJet 4 4M)", record, kSlashes},
        {kNone, "LaserJet 4/4M", kNone, record, MatchReason::product},
        {kNone, "LaserJet 4 4M+", kNone, record, kNone},
        {kNone, "LaserJet 4/4M", kNone, productRecord({"LaserJet 4 4M"}), kNone},
        {kNone, "LaserJet/4 4M", kNone, record, kNone},
        {kNone, "a b c", kNone, productRecord({"a/b/c"}), kSlashes},
        {kNone, "a b/c", kNone, productRecord({"a/b/c"}), kNone},
    });
}

TEST(DriverMatch, ComparesTheProductOfItsDeviceID) {
    const auto record = idRecord("MFG:HP;MDL:LaserJet 4;");
    constexpr auto kProduct = MatchReason::deviceIDProduct;
    expectEach({
        {kNone, kNone, "(hp laserjet 4)", record, kProduct},
        {"product:(HP LaserJet 4);", kNone, kNone, record, kProduct},
        {kNone, "(HP LaserJet 4)", kNone, record, kProduct},
        {"MDL:(HP LaserJet 4);", kNone, kNone, record, kProduct},
        {kNone, kNone, "((HP LaserJet 4))", record, kNone},
        {kNone, "HP LaserJet 4", kNone, record, kNone},
        {kNone, kNone, "(HP Only)", idRecord("product:(HP Only);"), kProduct},
        {kNone, kNone, "one", idRecord("product:one;"), kProduct},
    });
}

TEST(DriverMatch, KnowsTheMakersLongAndDoubledNames) {
    for (const auto* id : {"MFG:Hewlett-Packard;MDL:HP LaserJet;", "MFG:HP;MDL:HP LaserJet;",
                           "MFG:hewlett-packard;MDL:LaserJet;", "product:(Hewlett-Packard HP LaserJet)"})
        EXPECT_EQ(DeviceToMatch(kNone, kNone, "(HP LaserJet)").match(idRecord(id)),
                  MatchReason::deviceIDProduct)
            << id;
    for (const auto* id : {"MFG:Lexmark International;MDL:Lexmark Z22;", "MFG:Lexmark International;MDL:Z22;",
                           "MFG:Lexmark;MDL:Lexmark Z22;"})
        EXPECT_EQ(DeviceToMatch(kNone, kNone, "(LEXMARK Z22)").match(idRecord(id)),
                  MatchReason::deviceIDProduct)
            << id;
    EXPECT_EQ(DeviceToMatch(kNone, kNone, "(HP2000)").match(idRecord("product:(Hewlett-Packard HP2000)")),
              MatchReason::deviceIDProduct);
    EXPECT_EQ(DeviceToMatch(kNone, kNone, "(HP )").match(idRecord("product:(Hewlett-Packard )")),
              MatchReason::deviceIDProduct);
}

TEST(DriverMatch, ComparesTheModelOfItsDeviceIDWithModelsOnly) {
    const auto record = idRecord("MFG:HP;MDL:LaserJet 4;");
    expectEach({
        {kNone, "LASERJET 4", kNone, record, MatchReason::deviceIDModel},
        {"MFG:Other;MDL:laserjet 4;", kNone, kNone, record, MatchReason::deviceIDModel},
        {kNone, kNone, "LaserJet 4", record, kNone},
        {kNone, kNone, "(LaserJet 4)", record, kNone},
        {kNone, "LaserJet", kNone, record, kNone},
        {kNone, "LaserJet 4", kNone, idRecord("MDL:LaserJet 4"), MatchReason::deviceIDModel},
        {kNone, "deskjet 990c)", kNone, idRecord("product:(deskjet 990c)"), MatchReason::deviceIDModel},
    });
}

TEST(DriverMatch, ComparesItsNameWithModels) {
    const auto record = nameRecord("Epson Stylus C80");
    expectEach({
        {kNone, "epson stylus c80", kNone, record, MatchReason::makeAndModel},
        {"MDL:Epson Stylus C80;", kNone, kNone, record, MatchReason::makeAndModel},
        {"MFG:Epson;MDL:Stylus C80;", kNone, kNone, record, kNone},
        {kNone, kNone, "Epson Stylus C80", record, kNone},
        {kNone, kNone, "(Epson Stylus C80)", record, kNone},
        {kNone, "Epson Stylus", kNone, record, kNone},
    });
}

TEST(DriverMatch, TakesTheBeginningOfAGutenprintDriversName) {
    const auto record = nameRecord("Epson Stylus C80 - CUPS+Gutenprint", "gutenprint.5.3://escp2-c80/expert");
    constexpr auto kName = MatchReason::gutenprintName;
    expectEach({
        {kNone, "epson stylus c80", kNone, record, kName},
        {kNone, "Stylus C80", kNone, record, kNone},
        {"MDL:EPSON stylus;", kNone, kNone, record, kName},
        {"MFG:Epson;MDL:Stylus C80;", kNone, kNone, record, kName},
        {kNone, kNone, "(Epson Stylus C80)", record, kName},
        {kNone, kNone, "Epson Stylus C80", record, kNone},
        {kNone, "Epson Stylus C80 - CUPS+Gutenprint and more", kNone, record, kNone},
        {kNone, "Epson", kNone, nameRecord("Epson Stylus", "Gutenprint.5.3://a"), kNone},
        {kNone, "Epson", kNone, nameRecord("Epson Stylus", "/gutenprint"), kNone},
    });
}

TEST(DriverMatch, ComparesItsModelNumber) {
    const auto record = numberRecord("X5");
    expectEach({
        {kNone, kNone, "x5", record, MatchReason::modelNumber},
        {kNone, "x5", kNone, record, MatchReason::modelNumber},
        {"MDL:x5;", kNone, kNone, record, MatchReason::modelNumber},
        {"product:x5;", kNone, kNone, record, MatchReason::modelNumber},
        {kNone, kNone, "(x5)", record, kNone},
        {"product:(x5);", kNone, kNone, record, kNone},
    });
}

TEST(DriverMatch, NamesTheFirstReasonOfSeveral) {
    auto record = nameRecord("A", "gutenprint");
    record.modelNumber = "A";
    EXPECT_EQ(DeviceToMatch(kNone, "A", kNone).match(record), MatchReason::makeAndModel);
    record.deviceID = "MFG:x;MDL:A;";
    EXPECT_EQ(DeviceToMatch(kNone, "A", kNone).match(record), MatchReason::deviceIDModel);
    record.deviceID = "product:A;";
    EXPECT_EQ(DeviceToMatch(kNone, "A", kNone).match(record), MatchReason::deviceIDProduct);
    record.product = {"A"};
    EXPECT_EQ(DeviceToMatch(kNone, "A", kNone).match(record), MatchReason::product);
}

TEST(DriverMatch, IgnoresTheCaseOfEveryAlphabet) {
    expectEach({
        {kNone, "BÜRO ÉCRAN ДРУК", kNone, productRecord({"büro écran друк"}), MatchReason::product},
        {kNone, "büro 1", kNone, nameRecord("BÜRO 1 plus", "gutenprint"), MatchReason::gutenprintName},
        {kNone, "Büro", kNone, idRecord("MDL:BÜRO;"), MatchReason::deviceIDModel},
        {kNone, "büro", kNone, productRecord({"buro"}), kNone},
        {kNone, "b\xfc", kNone, productRecord({"B\xfc"}), MatchReason::product},
        {kNone, "b\xdc", kNone, productRecord({"B\xfc"}), kNone},
    });
}

TEST(DriverMatch, OfADeviceThatSaysNothingIsEmpty) {
    const std::vector<PPDRecord> list{
        productRecord({"", "a"}),      idRecord(""),      idRecord("CMD:PS;"), nameRecord("a"),
        nameRecord("a", "gutenprint"), numberRecord("0"), PPDRecord{}};
    EXPECT_THAT(PPDManager::matchPPDsByDeviceID(kNone, kNone, kNone, list), IsEmpty());
    EXPECT_THAT(PPDManager::matchPPDsByProduct(kNone, list), IsEmpty());
    EXPECT_THAT(PPDManager::matchPPDsByModel(kNone, list), IsEmpty());
    EXPECT_THAT(PPDManager::matchPPDsByDeviceID("", "", "", list), IsEmpty());
}

TEST(DriverMatch, ByProductOrModelAsksForNothingElse) {
    const std::vector<PPDRecord> list{productRecord({"DeskJet"}), idRecord("MFG:HP;MDL:DeskJet;")};
    EXPECT_THAT(PPDManager::matchPPDsByProduct("(DeskJet)", list), ElementsAre(list[0]));
    EXPECT_THAT(PPDManager::matchPPDsByModel("DeskJet", list), ElementsAre(list[0], list[1]));
    EXPECT_THAT(PPDManager::matchPPDsByProduct("(HP DeskJet)", list), ElementsAre(list[1]));
}

TEST(DriverMatch, SurvivesAHugeDeviceID) {
    const std::string huge = "MFG:HP;MDL:" + std::string(64 << 10, 'j') + ";";
    EXPECT_EQ(DeviceToMatch(huge, kNone, kNone).match(idRecord(huge)), MatchReason::deviceIDProduct);
    EXPECT_EQ(DeviceToMatch(huge, kNone, kNone).match(idRecord("MFG:HP;MDL:j;")), kNone);
    EXPECT_EQ(
        DeviceToMatch(std::string(64 << 10, ';'), kNone, kNone).match(idRecord(std::string(64 << 10, ';'))),
        kNone);
}

std::vector<std::string> namesOf(const std::vector<PPDRecord>& records) {
    std::vector<std::string> names;
    for (const auto& record : records)
        names.push_back(record.name.value_or("") + record.driverName.value_or(""));
    return names;
}

TEST(DriverOrder, IsByKindWhateverTheListsOrder) {
    std::vector<PPDRecord> list;
    for (const auto* name : {"drv:///a", "/hpijs", "drv:///b", "/x", "/Vellum.ppd"}) {
        list.push_back(productRecord({"A"}));
        list.back().name = name;
    }
    list.push_back(productRecord({"a"}));
    list.back().suDriverPredicate = "SU";
    list.back().name = "su";
    const auto order = ElementsAre("/Vellum.ppd", "/x", "su", "/hpijs", "drv:///a", "drv:///b");
    EXPECT_THAT(namesOf(PPDManager::matchPPDsByModel("A", list)), order);
    std::swap(list[0], list[2]);
    std::ranges::reverse(list);
    EXPECT_THAT(namesOf(PPDManager::matchPPDsByModel("A", list)), order);
}

TEST(DriverOrder, WithinAKindIsTheListsOrder) {
    std::vector<PPDRecord> list;
    std::vector<std::string> names;
    for (int i = 0; i < 100; ++i) {
        names.push_back("drv:///" + std::to_string(i * 7 % 100));
        list.push_back(productRecord({"A"}));
        list.back().name = names.back();
    }
    EXPECT_EQ(namesOf(PPDManager::matchPPDsByModel("A", list)), names);
}

TEST(DriverOrder, WithinAKindIsByDriverNameWhereThereIsOne) {
    std::vector<PPDRecord> list;
    for (const auto& driverName : std::initializer_list<Text>{"b", kNone, "C", "a", kNone, "B"}) {
        list.push_back(productRecord({"A"}));
        list.back().driverName = driverName;
    }
    EXPECT_THAT(namesOf(PPDManager::matchPPDsByModel("A", list)), ElementsAre("a", "", "b", "B", "", "C"));
    list[2].name = "/x";
    EXPECT_THAT(namesOf(PPDManager::matchPPDsByModel("A", list)), ElementsAre("/xC", "a", "", "b", "", "B"));
}

TEST(MatchReasons, EachHaveATextOfTheirOwn) {
    std::set<std::string_view> texts;
    for (auto reason = MatchReason::product; reason <= MatchReason::modelNumber;
         reason = static_cast<MatchReason>(static_cast<int>(reason) + 1))
        texts.insert(describe(reason));
    EXPECT_EQ(texts.size(), 7U);
}

/// Makes devices and drivers out of few words, so that they often nearly fit.
class RandomCatalogue {
public:
    explicit RandomCatalogue(std::uint32_t seed) : random_(seed) {}

    std::string words() {
        std::string text;
        for (auto count = 1 + pick(3); count > 0; --count)
            text += (text.empty() ? "" : separators_[pick(separators_.size())]) + words_[pick(words_.size())];
        return text;
    }

    std::string product() { return chance(3) ? "(" + words() + ")" : words(); }

    std::string deviceID() {
        std::string id;
        for (auto count = 1 + pick(3); count > 0; --count)
            id += keys_[pick(keys_.size())] + (chance(4) ? product() : words()) + (chance(9) ? "" : ";");
        return id;
    }

    Text maybe(std::string text) { return chance(2) ? kNone : Text(std::move(text)); }

    PPDRecord record() {
        PPDRecord record;
        record.name = names_[pick(names_.size())];
        for (auto count = pick(3); count > 0; --count)
            record.product.push_back(chance(8) ? "" : product());
        record.deviceID = maybe(deviceID());
        record.makeAndModel = maybe(words());
        record.modelNumber = maybe(words_[pick(words_.size())]);
        return record;
    }

    /// Says of itself what one of the drivers says, or something else.
    std::array<Text, 3> device(const std::vector<PPDRecord>& list) {
        const auto& kin = list[pick(list.size())];
        if (kin.deviceID && chance(3))
            return {kNone, kNone, PMStringAdditions::product(*kin.deviceID)};
        if (kin.deviceID && chance(3))
            return {kNone, PMStringAdditions::model(*kin.deviceID), kNone};
        return {maybe(deviceID()), maybe(words()), maybe(product())};
    }

    std::vector<PPDRecord> records(int count) {
        std::vector<PPDRecord> list;
        for (int i = 0; i < count; ++i)
            list.push_back(record());
        return list;
    }

private:
    std::size_t pick(std::size_t count) { return random_() % count; }
    bool chance(std::size_t oneIn) { return pick(oneIn) == 0; }

    std::mt19937 random_;
    std::vector<std::string> words_{"HP",
                                    "hp",
                                    "Hewlett-Packard",
                                    "Lexmark",
                                    "Lexmark International",
                                    "LaserJet",
                                    "LASERJET",
                                    "4",
                                    "4/4M",
                                    "4 4M",
                                    "Büro",
                                    "BÜRO",
                                    "(deskjet",
                                    "a",
                                    "A)",
                                    "(",
                                    "0"};
    std::vector<std::string> separators_{" ", " ", " ", "/", "", "  "};
    std::vector<std::string> keys_{"MFG:", "MDL:", "product:", "ty:", "MODEL:", "CMD:", " mdl:"};
    std::vector<std::string> names_{"gutenprint.5.3://a", "drv:///a", "/x/Vellum.ppd", "/hpijs", "/x"};
};

std::string shown(const Text& text) {
    return text ? "'" + *text + "'" : "none";
}

TEST(DriverMatch, AgreesWithThePlainWayOnRandomCatalogues) {
    std::size_t matches = 0;
    for (std::uint32_t seed = 0; seed < 120; ++seed) {
        RandomCatalogue random(seed);
        const auto list = random.records(100);
        for (int device = 0; device < 10; ++device) {
            const auto& [deviceID, model, product] = random.device(list);
            std::vector<std::size_t> found;
            for (const auto& match : matchingDrivers(DeviceToMatch(deviceID, model, product), list))
                found.push_back(match.index);
            matches += found.size();
            ASSERT_EQ(found, naive::matchingDrivers(deviceID, model, product, list))
                << "seed " << seed << ", device ID " << shown(deviceID) << ", model " << shown(model)
                << ", product " << shown(product);
        }
    }
    EXPECT_GT(matches, 3'000U);
}

}  // namespace
}  // namespace ventras
