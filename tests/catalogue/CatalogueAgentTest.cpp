#include "catalogue/CatalogueAgent.h"

#include <gtest/gtest.h>

#include "platform/Log.h"
#include "tests/catalogue/CatalogueTexts.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

class LogLines final : public Log {
public:
    void error(const std::string& line) override { lines.push_back(line); }

    std::vector<std::string> lines;
};

using Reply = std::optional<PropertyDictionary>;

const std::string kLaserJet4 = "MANUFACTURER:HP;MODEL:LaserJet 4";

/// An agent whose catalogue has this text.
class AgentOf {
public:
    explicit AgentOf(const std::string& catalogue)
        : agent_(folder_.write("driver-packages.plist", catalogue), "debian 12", log) {}

    Reply ask(const PropertyDictionary& arguments, std::uint32_t command = 1) {
        return agent_.answer(command, arguments);
    }

    LogLines log;

private:
    TemporaryFolder folder_;
    CatalogueAgent agent_;
};

PropertyDictionary count(std::int64_t number, bool isCurrent = true) {
    return {{"count", number}, {"is_cache_current", isCurrent}};
}

TEST(CatalogueAgent, CountsTheBestPackages) {
    AgentOf agent(smallCatalogue());
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}), count(1));
    EXPECT_EQ(agent.ask({{"scanID", "MFG:HP;MDL:LaserJet 5;CMD:PCL;"}, {"Vellum", true}}), count(1));
    EXPECT_EQ(agent.ask({{"scanID", "MANUFACTURER:HP;MODEL:none"}}), count(0));
    EXPECT_EQ(agent.ask({{"scanID", ""}}), count(0));
    EXPECT_EQ(agent.ask({{"scanID", std::string(10'000, '(')}}), count(0));
}

TEST(CatalogueAgent, NamesPackagesThatAreEquallyGood) {
    AgentOf agent(smallCatalogue());
    auto expected = count(2);
    expected.emplace("conflicts", PropertyArray{"laser-driver", "other-laser-driver"});
    EXPECT_EQ(agent.ask({{"scanID", "MANUFACTURER:HP;MODEL:LaserJet 6"}}), expected);
}

TEST(CatalogueAgent, CountsDriverlessPackagesOnRequest) {
    auto entry = packageEntry(0, {kLaserJet4});
    entry.emplace("driverless", true);
    AgentOf agent(textOf(catalogueContent({{"driverless", entry}})));
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}), count(0));
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}, {"Vellum", false}}), count(0));
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}, {"Vellum", "yes"}}), count(0));
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}, {"Vellum", true}}), count(1));
}

TEST(CatalogueAgent, SaysWhenTheCatalogueIsOfAnotherRelease) {
    AgentOf agent(smallCatalogue("debian 13"));
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}), count(1, false));
}

TEST(CatalogueAgent, KnowsNoPackageWithoutAUsableCatalogueAndLogsItOnce) {
    for (const auto& text : {std::string(), smallCatalogue().substr(0, 300), std::string("<plist/>")}) {
        AgentOf agent(text);
        EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}), count(0, false)) << text;
        EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}), count(0, false)) << text;
        EXPECT_EQ(agent.log.lines.size(), 1U) << text;
    }
    LogLines log;
    CatalogueAgent agent("/does/not/exist", "debian 12", log);
    EXPECT_EQ(agent.answer(1, {{"scanID", kLaserJet4}}), count(0, false));
    EXPECT_EQ(log.lines, std::vector<std::string>{"driver packages cannot be looked up: "
                                                  "/does/not/exist: there is no such file"});
}

TEST(CatalogueAgent, RefusesWhatMakesNoSense) {
    AgentOf agent(smallCatalogue());
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}, 0), std::nullopt);
    EXPECT_EQ(agent.ask({{"scanID", kLaserJet4}}, 2), std::nullopt);
    EXPECT_EQ(agent.ask({}), std::nullopt);
    EXPECT_EQ(agent.ask({{"scanID", true}}), std::nullopt);
    EXPECT_EQ(agent.ask({{"scanID", std::string(70'000, 'x')}}), std::nullopt);
}

}  // namespace
}  // namespace ventras
