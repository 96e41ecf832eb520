#include "drivers/SoftwareUpdateDrivers.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "drivers/PPDManager.h"
#include "tests/drivers/PPDText.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/OpenedPpd.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Lines = std::vector<std::string>;

PrintToolAgentReply onePackage() {
    return {0, {{"count", std::int64_t{1}}}};
}

class SoftwareUpdateDriver : public testing::Test {
protected:
    std::optional<PPDRecord> ask(PropertyDictionary reply, std::int32_t status = 0) {
        fakes_.printToolAgent.otherwise = {status, std::move(reply)};
        return manager_.softwareUpdateDriverFor("MFG:a;MDL:b;", false);
    }

    std::optional<PPDRecord> askForPPD(const Lines& lines) {
        return manager_.softwareUpdateForPPD(openedPpd(ppdText(lines)).get());
    }

    Lines asked() const {
        Lines deviceIDs;
        for (const auto& command : fakes_.printToolAgent.commands)
            deviceIDs.push_back(*findText(command.arguments, "scanID"));
        return deviceIDs;
    }

    FakePlatform fakes_;
    PPDManager manager_{fakes_.platform};
};

TEST_F(SoftwareUpdateDriver, IsAskedForWithTheAgentsFirstCommand) {
    for (const bool vellum : {true, false}) {
        manager_.softwareUpdateDriverFor("MFG:a;MDL:b;", vellum);
        const auto& command = fakes_.printToolAgent.commands.back();
        EXPECT_EQ(command.service, "com.quillon.lorvextool.agent");
        EXPECT_EQ(command.command, 1);
        EXPECT_EQ(command.arguments, (PropertyDictionary{{"scanID", "MFG:a;MDL:b;"}, {"Vellum", vellum}}));
    }
}

TEST_F(SoftwareUpdateDriver, IsNotAskedForWithoutADeviceID) {
    fakes_.printToolAgent.otherwise = onePackage();
    EXPECT_EQ(manager_.softwareUpdateDriverFor(std::nullopt, true), std::nullopt);
    EXPECT_THAT(fakes_.printToolAgent.commands, IsEmpty());
}

TEST_F(SoftwareUpdateDriver, IsARecordOfWhatTheAgentSaid) {
    PPDRecord expected;
    expected.suDriverPredicate = "MFG:a;MDL:b;";
    EXPECT_EQ(ask({{"count", std::int64_t{1}}}), expected);
    EXPECT_EQ(PPDManager::ppdKind(ask({{"count", std::int64_t{1}}})), 4U);

    expected.suDriverConflicts = PropertyArray{"x"};
    expected.suCacheCurrent = false;
    const auto record = ask({{"count", std::int64_t{1}},
                             {"conflicts", PropertyArray{"x"}},
                             {"is_cache_current", false},
                             {"y", "z"}});
    EXPECT_EQ(record, expected);
    EXPECT_EQ(PPDManager::ppdKind(record), 5U);
}

TEST_F(SoftwareUpdateDriver, IsNothingUnlessThereIsExactlyOnePackage) {
    EXPECT_EQ(ask({{"count", std::int64_t{1}}}, 5), std::nullopt);
    EXPECT_EQ(ask({{"count", std::int64_t{1}}}, -1), std::nullopt);
    for (const std::int64_t count : {0, 2, -1, 100})
        EXPECT_EQ(ask({{"count", count}}), std::nullopt) << count;
    EXPECT_EQ(ask({}), std::nullopt);
    EXPECT_EQ(ask({{"count", PropertyArray{std::int64_t{1}}}}), std::nullopt);
}

const Lines kFullPPD{
    "*1284DeviceID: \"MFG:Acme;MDL:Jet ID;\"",
    "*Manufacturer: \"Acme\"",
    "*ModelName: \"Acme Jet\"",
    "*NickName: \"Acme Nick\"",
    "*ShortNickName: \"Acme Short\"",
    "*Product: \"(Acme Jet 1)\"",
    "*Product: \"(Jet)\"",
};

TEST_F(SoftwareUpdateDriver, IsAskedForUnderEachIdentityOfAPPD) {
    EXPECT_EQ(askForPPD(kFullPPD), std::nullopt);
    EXPECT_THAT(asked(), ElementsAre("MFG:Acme;MDL:Jet ID;",                //
                                     "MANUFACTURER:Acme;MODEL:Jet",         // normalised
                                     "MANUFACTURER:Acme;MODEL:Acme Nick",   // as it stands
                                     "MANUFACTURER:Acme;MODEL:Acme Short",  // as it stands
                                     "MANUFACTURER:Acme;MODEL:Jet 1",       // from the product alone
                                     "MANUFACTURER:Acme;MODEL:Jet 1"));     // from maker and product
    for (const auto& command : fakes_.printToolAgent.commands)
        EXPECT_EQ(command.arguments.at("Vellum"), PropertyValue(true));
}

TEST_F(SoftwareUpdateDriver, IsAskedForByModelAloneOnlyWhenThatNamesAMakeToo) {
    askForPPD({"*ModelName: \"Jet 1;MFG:Acme\"", "*ShortNickName: \"Jet 2;MFG:Acme\"",
               "*NickName: \"Jet 3;MFG:Acme\"", "*PCFileName: \"a\""});
    EXPECT_THAT(asked(), ElementsAre("MANUFACTURER:Acme;MODEL:Jet 1", "MANUFACTURER:Acme;MODEL:Jet 2",
                                     "MANUFACTURER:Acme;MODEL:Jet 3"));
}

TEST_F(SoftwareUpdateDriver, PutsTheMakerBeforeAProductThatNamesNone) {
    askForPPD({"*Manufacturer: \"Acme\"", "*Product: \"(Jet 5)\""});
    EXPECT_THAT(asked(), ElementsAre("MANUFACTURER:Jet;MODEL:5", "MANUFACTURER:Acme;MODEL:5"));
}

TEST_F(SoftwareUpdateDriver, IsNotAskedForUnderIdentitiesThatAPPDLacks) {
    askForPPD({"*NickName: \"Nick\""});
    EXPECT_THAT(asked(), IsEmpty());
    askForPPD({"*1284DeviceID: \"\"", "*Manufacturer: \"Acme\""});
    EXPECT_THAT(asked(), ElementsAre(""));
}

TEST_F(SoftwareUpdateDriver, OfTheFirstIdentityThatHasOneIsTaken) {
    const Lines identities{"MFG:Acme;MDL:Jet ID;", "MANUFACTURER:Acme;MODEL:Jet",
                           "MANUFACTURER:Acme;MODEL:Acme Nick", "MANUFACTURER:Acme;MODEL:Acme Short",
                           "MANUFACTURER:Acme;MODEL:Jet 1"};
    for (std::size_t i = 0; i < identities.size(); ++i) {
        fakes_.printToolAgent.commands.clear();
        fakes_.printToolAgent.replies = {{identities[i], onePackage()}};
        const auto record = askForPPD(kFullPPD);
        ASSERT_TRUE(record) << identities[i];
        EXPECT_EQ(record->suDriverPredicate, PropertyValue(identities[i]));
        EXPECT_EQ(asked(),
                  Lines(identities.begin(), identities.begin() + static_cast<std::ptrdiff_t>(i) + 1));
    }
}

TEST_F(SoftwareUpdateDriver, IsAskedForInUTF8) {
    askForPPD({"*LanguageEncoding: ISOLatin1", "*1284DeviceID: \"MDL:B\xfcro;\""});
    EXPECT_THAT(asked(), ElementsAre("MDL:Büro;"));
}

}  // namespace
}  // namespace ventras
