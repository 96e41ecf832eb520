#include "queues/QueueNaming.h"

#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "tests/fakes/FakePrintSystem.h"

namespace ventras {
namespace {

using Identifier = std::optional<std::string>;

// A print system whose two suggestions a test sets.
class Suggestions final : public PrintSystemService {
public:
    Identifier plain, unique;
    std::vector<std::string> asked;

    Identifier suggestQueueName(const std::string& name, bool isUnique) override {
        asked.push_back(name);
        return isUnique ? unique : plain;
    }

    Identifier copyLocalServerURL() override { return std::nullopt; }
    std::int32_t createQueue(const std::string&, const std::string&, const std::string&,
                             const std::map<std::string, std::string>&) override {
        return -1;
    }
    std::int32_t removeQueue(const std::string&) override { return -1; }
    std::int32_t setDefaultPrinter(const std::string&) override { return -1; }
    bool isFax(const std::string&) override { return false; }
    bool isScanner(const std::string&) override { return false; }
    Identifier copyQueuePPD(const std::string&) override { return std::nullopt; }
    std::int32_t setQueuePPD(const std::string&, const std::string&) override { return -1; }
    Identifier copyLocalizedPPD(const std::string&) override { return std::nullopt; }
    bool useLastPrinterAsCurrentPrinter() override { return false; }
    AutoSelectCreation autoSelectCreateContext(const std::string&) override { return {-1, nullptr}; }
};

TEST(SuggestedDisplayName, CarriesTheSuffixThatMakesTheIdentifierUnique) {
    struct Case {
        std::string name;
        Identifier plain, unique;
        std::string expected;
    };
    const std::vector<Case> cases{
        {"HP LaserJet", "HP_LaserJet", "HP_LaserJet_2", "HP LaserJet 2"},
        {"HP LaserJet", "HP_LaserJet", "HP_LaserJet_12", "HP LaserJet 12"},
        {"HP LaserJet", "HP_LaserJet", "HP_LaserJet-b c", "HP LaserJet b c"},
        {"HP LaserJet", "HP_LaserJet", "HP_LaserJet_", "HP LaserJet "},
        {"HP LaserJet", "HP_LaserJet", "HP_LaserJet", "HP LaserJet"},
        {"HP LaserJet", "HP_LaserJet", "HP_Laser", "HP LaserJet"},
        {"HP LaserJet", "HP_LaserJet", "hp_laserjet_2", "HP LaserJet"},
        {"HP LaserJet", "HP_LaserJet", "Other_Laser_2", "HP LaserJet"},
        {"HP LaserJet", std::nullopt, "HP_LaserJet_2", "HP LaserJet"},
        {"HP LaserJet", "HP_LaserJet", std::nullopt, "HP LaserJet"},
        {"HP LaserJet", std::nullopt, std::nullopt, "HP LaserJet"},
        {"Büro", "Büro", "Büro_2", "Büro 2"},
    };
    for (const auto& [name, plain, unique, expected] : cases) {
        Suggestions printSystem;
        printSystem.plain = plain;
        printSystem.unique = unique;
        EXPECT_EQ(suggestedDisplayName(printSystem, name), expected)
            << plain.value_or("-") << ", " << unique.value_or("-");
        EXPECT_EQ(printSystem.asked, (std::vector<std::string>{name, name}));
    }
}

TEST(SuggestedDisplayName, FollowsAPrintSystemThatNumbersItsQueues) {
    FakePrintSystem printSystem;
    EXPECT_EQ(suggestedDisplayName(printSystem, "HP LaserJet"), "HP LaserJet");
    printSystem.taken = {"HP_LaserJet", "HP_LaserJet_2"};
    EXPECT_EQ(suggestedDisplayName(printSystem, "HP LaserJet"), "HP LaserJet 3");
}

TEST(StripBracketedTag, DropsATagOfFiveToSevenCharactersAtTheVeryEnd) {
    const std::vector<std::pair<std::string, std::string>> cases{
        {"HP LaserJet [12AB34]", "HP LaserJet"},
        {"HP LaserJet [12345]", "HP LaserJet"},
        {"HP LaserJet [1234567]", "HP LaserJet"},
        {"HP LaserJet [1234]", "HP LaserJet [1234]"},
        {"HP LaserJet [12345678]", "HP LaserJet [12345678]"},
        {"HP LaserJet []", "HP LaserJet []"},
        {"HP LaserJet [12AB34] ", "HP LaserJet [12AB34] "},
        {"HP LaserJet [12AB34]x", "HP LaserJet [12AB34]x"},
        {"HP LaserJet 12AB34]", "HP LaserJet 12AB34]"},
        {"HP LaserJet [12AB34", "HP LaserJet [12AB34"},
        {"HP ]LaserJet[12AB34", "HP ]LaserJet[12AB34"},
        {"HP [x] [12AB34]", "HP [x]"},
        {"HP [12AB34] [12AB34]", "HP [12AB34]"},
        {"HP [a[12AB34]", "HP [a"},
        {"HP [12]4567]", "HP"},  // the last "[" counts, and the last "]"
        {"HP LaserJet[12AB34]", "HP LaserJet"},
        {" \t HP \r\n [12AB34]", "HP"},
        {"HP [äöüßé]", "HP"},  // five characters in ten bytes
        {"HP [äöüß]", "HP [äöüß]"},
        {"HP [印刷機の名前一]", "HP"},
        {"HP [印刷機の名前一二]", "HP [印刷機の名前一二]"},
        {"[12AB34]", ""},
        {"]", "]"},
        {"[", "["},
        {"", ""},
    };
    for (const auto& [name, expected] : cases)
        EXPECT_EQ(stripBracketedTag(name), expected) << name;
}

}  // namespace
}  // namespace ventras
