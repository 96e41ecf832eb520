#include "agent/InstallerSettings.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/devices/FakeDevice.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

DevicePtr device(std::optional<std::string> name) {
    return std::make_shared<FakeDevice>(std::move(name));
}

TEST(InstallerSettings, AreTheFixedTextsAndDemands) {
    const FakeStrings strings;
    const auto settings = installerSettings(strings, FakeResources{});
    EXPECT_EQ(settings.noNetworkTitle, "Unable to connect to internet.");
    EXPECT_EQ(settings.noNetworkMessage, "Intentionally left blank.");
    EXPECT_EQ(settings.noServerTitle, "Unable to reach the Software Update Server.");
    EXPECT_EQ(settings.busyTitle, "Software Update is currently running.");
    EXPECT_EQ(settings.busyMessage,
              "You can download and install the software when the other download is complete.");
    EXPECT_EQ(settings.legalTextType, 2);
    EXPECT_EQ(settings.helpAnchor, "mh28042");
    EXPECT_TRUE(settings.requiresLicenceAgreement);
}

TEST(InstallerSettings, NameThePrinterIconOfThePrintSystemWhereThereIsOne) {
    const TemporaryFolder folder;
    FakeResources resources;
    resources.folder = folder.path();
    EXPECT_EQ(installerSettings(FakeStrings{}, resources).icon, "");
    const auto icon = folder.write("GenericPostscriptPrinter.svg", "<svg/>");
    EXPECT_EQ(installerSettings(FakeStrings{}, resources).icon, icon);
}

TEST(InstallerSettings, SpeakTheUsersLanguage) {
    FakeStrings strings;
    strings.translations = {{"Unable to connect to internet.", "Kein Internet."},
                            {"Software Update is currently running.", "Läuft schon."}};
    const auto settings = installerSettings(strings, FakeResources{});
    EXPECT_EQ(settings.noNetworkTitle, "Kein Internet.");
    EXPECT_EQ(settings.busyTitle, "Läuft schon.");
}

TEST(PromptTitle, NamesTheOnePrinterAndNoneOfSeveral) {
    const FakeStrings strings;
    EXPECT_EQ(promptTitle(strings, std::vector{device("Office")}),
              "Would you like to download and install software for 'Office'?");
    EXPECT_EQ(promptTitle(strings, std::vector{device(std::nullopt)}),
              "Would you like to download and install software for '(null)'?");
    EXPECT_EQ(promptTitle(strings, std::vector{device("Office"), device("Lab")}),
              "Would you like to install software for your printers?");
}

TEST(PromptTitle, TakesANameAsTextNotAsAFormat) {
    EXPECT_EQ(promptTitle(FakeStrings{}, std::vector{device("%@ %s %n")}),
              "Would you like to download and install software for '%@ %s %n'?");
}

TEST(PromptTitle, PutsTheNameWhereTheTranslationWantsIt) {
    FakeStrings strings;
    const std::string english = "Would you like to download and install software for '%@'?";
    strings.translations = {{english, "%@: Software laden?"}};
    EXPECT_EQ(promptTitle(strings, std::vector{device("Büro")}), "Büro: Software laden?");
    strings.translations = {{english, "Software laden?"}};
    EXPECT_EQ(promptTitle(strings, std::vector{device("Büro")}), "Software laden?");
}

}  // namespace
}  // namespace ventras
