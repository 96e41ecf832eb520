#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "download/DownloadTriggerOperation.h"
#include "tests/agent-unit/Round.h"
#include "tests/devices/FakeDevice.h"

namespace ventras {
namespace {

constexpr std::uint32_t kPlace = 0x01100000;
constexpr std::uint32_t kOtherPlace = 0x01200000;

const std::string kSoftwareKind = "((\"printing software\" in tags ) OR (\"printer update\" in tags ))";

class SoftwareOffer : public Round {
protected:
    // Lets the installer call the delegate back on a later turn of the run loop, as the real one does.
    void installerEnds(const std::function<void(PredicateInstallDelegate&)>& end) {
        fake_.installer.onStart = [this, end](FakeInstaller& installer) {
            helper_ = std::jthread([this, end, &installer] {
                fake_.runLoop.performOnMainThread([&] { end(*installer.delegate); });
            });
        };
    }

    std::jthread helper_;
};

TEST_F(SoftwareOffer, IsMadeForAPrinterWithExactlyOnePackage) {
    offerPackages("Winjet", 1);
    installerEnds([](auto& delegate) { delegate.predicateInstallUserDidCancel(); });
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);

    EXPECT_EQ(fake_.installer.title, "Would you like to download and install software for 'Acme Winjet'?");
    EXPECT_EQ(fake_.installer.predicates,
              std::vector<std::string>{kSoftwareKind + " AND (\"" + scanID("Winjet") + "\" IN tags)"});
    EXPECT_EQ(fake_.installer.confirmCompletion, false);
    EXPECT_EQ(fake_.installer.installedPrinters,
              (PropertyDictionary{{"InstalledPrinters", PropertyArray{scanID("Winjet")}},
                                  {"Manufacturers", PropertyArray{"Acme"}}}));
}

TEST_F(SoftwareOffer, AsksTheAgentOfThePrintToolByTheScanID) {
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);
    ASSERT_EQ(fake_.printToolAgent.commands.size(), 1U);
    const auto& command = fake_.printToolAgent.commands[0];
    EXPECT_EQ(command.service, "com.quillon.lorvextool.agent");
    EXPECT_EQ(command.command, 1);
    EXPECT_EQ(command.arguments, (PropertyDictionary{{"scanID", scanID("Winjet")}}));
}

TEST_F(SoftwareOffer, IsMadeForSeveralPrintersAtOnce) {
    offerPackages("Winjet", 1);
    offerPackages("Pagejet", 1);
    installerEnds([](auto& delegate) { delegate.predicateInstallUserDidCancel(); });
    EXPECT_EQ(run({attach(kPlace, "Winjet"), attach(kOtherPlace, "Pagejet")}), 0);

    EXPECT_EQ(fake_.installer.title, "Would you like to install software for your printers?");
    // Which of the two has reported first is not said.
    const auto term = [](const std::string& model) { return "(\"" + scanID(model) + "\" IN tags)"; };
    const auto before = kSoftwareKind + " AND (";
    const auto predicate = fake_.installer.predicates.at(0);
    EXPECT_TRUE(predicate == before + term("Winjet") + " OR " + term("Pagejet") + ")" ||
                predicate == before + term("Pagejet") + " OR " + term("Winjet") + ")")
        << predicate;
    EXPECT_EQ(fake_.installer.installedPrinters.at("Manufacturers"),
              PropertyValue(PropertyArray{"Acme", "Acme"}));
}

TEST_F(SoftwareOffer, IsNotMadeForAnyOtherAnswer) {
    const std::vector<std::pair<std::string, PrintToolAgentReply>> replies{
        {"two packages", {0, {{"count", std::int64_t{2}}}}},
        {"none", {0, {{"count", std::int64_t{0}}}}},
        {"fewer than none", {0, {{"count", std::int64_t{-1}}}}},
        {"no count", {0, {}}},
        {"no number", {0, {{"count", "one"}}}},
        {"a failure", {1, {{"count", std::int64_t{1}}}}},
        {"a conflict", {0, {{"count", std::int64_t{1}}, {"conflicts", PropertyArray{"x"}}}}},
        {"an empty conflict", {0, {{"count", std::int64_t{1}}, {"conflicts", ""}}}},
    };
    for (const auto& [what, reply] : replies) {
        fake_.printToolAgent.otherwise = reply;
        VentrasController controller(fake_.platform, drivers_);
        DownloadTriggerOperation download(controller, fake_.platform);
        download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("Winjet", scanID("Winjet")));
        controller.operationCompleted(download);
        EXPECT_TRUE(controller.done()) << what;
        EXPECT_EQ(controller.exitStatus(), 1U) << what;
        EXPECT_EQ(download.printers().size(), 0U) << what;
        EXPECT_EQ(fake_.installer.predicates.size(), 0U) << what;
    }
}

TEST_F(SoftwareOffer, TakesACountThatComesAsAText) {
    fake_.printToolAgent.otherwise = {0, {{"count", "1"}}};
    DownloadTriggerOperation download(controller_, fake_.platform);
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("Winjet", scanID("Winjet")));
    controller_.operationCompleted(download);
    EXPECT_EQ(fake_.installer.predicates.size(), 1U);
    EXPECT_FALSE(controller_.done());
}

TEST_F(SoftwareOffer, IsNotMadeToAPrinterWithoutAScanID) {
    fake_.printToolAgent.otherwise = {0, {{"count", std::int64_t{1}}}};
    DownloadTriggerOperation download(controller_, fake_.platform);
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("Winjet", std::nullopt));
    controller_.operationCompleted(download);
    EXPECT_EQ(controller_.exitStatus(), 1U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 0U);
}

TEST_F(SoftwareOffer, EndsTheRunWhenThereIsNoScanIDForThePredicate) {
    fake_.printToolAgent.otherwise = {0, {{"count", std::int64_t{1}}}};
    DownloadTriggerOperation download(controller_, fake_.platform);
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("Winjet", ""));
    controller_.operationCompleted(download);
    EXPECT_TRUE(controller_.done());
    EXPECT_EQ(controller_.exitStatus(), ~std::uint64_t{0});
    EXPECT_EQ(fake_.installer.title, std::nullopt);
}

TEST_F(SoftwareOffer, NamesNoManufacturerThatAScanIDDoesNotTell) {
    fake_.printToolAgent.otherwise = {0, {{"count", std::int64_t{1}}}};
    DownloadTriggerOperation download(controller_, fake_.platform);
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("a", "nothing in it"));
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("b", scanID("Winjet")));
    controller_.operationCompleted(download);
    EXPECT_EQ(fake_.installer.installedPrinters,
              (PropertyDictionary{{"InstalledPrinters", PropertyArray{"nothing in it", scanID("Winjet")}},
                                  {"Manufacturers", PropertyArray{"Acme"}}}));
}

TEST_F(SoftwareOffer, RemembersEveryWaitingPrinterWhateverFollows) {
    offerPackages("Winjet", 2);
    EXPECT_EQ(run({attach(kPlace, "Winjet"), attach(kOtherPlace, "Pagejet")}), 0);
    ASSERT_EQ(fake_.preferences.settings.size(), 2U);
    EXPECT_EQ(fake_.preferences.settings[1].domain, "com.quillon.print.ventrasagent");
    EXPECT_EQ(fake_.preferences.settings[1].key, "Printers Seen");
    EXPECT_EQ(fake_.preferences.settings[1].value,
              PropertyValue(PropertyArray{scanID("Pagejet"), scanID("Winjet")}));
    EXPECT_EQ(controller_.exitStatus(), 1U);
}

TEST_F(SoftwareOffer, ThatIsNotMadeLeavesTheStatusOfAFailure) {
    EXPECT_EQ(run({attach(kPlace, "Winjet"), "ipp://127.0.0.1:1/"}), 0);
    EXPECT_EQ(controller_.exitStatus(), 255U);
}

TEST_F(SoftwareOffer, ThatTheUserCancelsEndsTheRun) {
    offerPackages("Winjet", 1);
    installerEnds([](auto& delegate) { delegate.predicateInstallUserDidCancel(); });
    EXPECT_EQ(run({attach(kPlace, "Winjet"), "ipp://127.0.0.1:1/"}), 0);
    EXPECT_EQ(controller_.exitStatus(), static_cast<std::uint64_t>(-128));
    EXPECT_EQ(fake_.imageDevices.announcements, 0);
}

TEST_F(SoftwareOffer, ThatFailsEndsTheRunWithTheErrorsCode) {
    offerPackages("Winjet", 1);
    installerEnds([](auto& delegate) { delegate.predicateInstallDidFailWithError(-1009); });
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);
    EXPECT_EQ(controller_.exitStatus(), static_cast<std::uint64_t>(-1009));
    EXPECT_EQ(fake_.imageDevices.announcements, 0);
}

TEST_F(SoftwareOffer, IsFollowedByARoundForThePrintersThatWereOffered) {
    offerPackages("Winjet", 1);
    offerPackages("Pagejet", 2);
    installerEnds([this](auto& delegate) {
        addQueue("by-the-package", usbURI("Winjet"));
        delegate.predicateInstallDidComplete();
    });
    EXPECT_EQ(run({attach(kPlace, "Winjet"), attach(kOtherPlace, "Pagejet"), "ipp://127.0.0.1:1/"}), 0);
    EXPECT_EQ(failuresOf(usbURI("Winjet")), 1);
    EXPECT_EQ(failuresOf(usbURI("Pagejet")), 1);
    EXPECT_EQ(failuresOf("ipp://127.0.0.1:1/"), 1);
    EXPECT_EQ(fake_.imageDevices.announcements, 1);
    EXPECT_EQ(controller_.exitStatus(), 255U);  // of the network printer, in the first round
}

TEST_F(SoftwareOffer, IsMadeOnceToAPrinterThatFindsNoDriverInTheSecondRoundEither) {
    offerPackages("Winjet", 1);
    installerEnds([](auto& delegate) { delegate.predicateInstallDidComplete(); });
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);
    EXPECT_EQ(failuresOf(usbURI("Winjet")), 2);
    EXPECT_EQ(fake_.installer.predicates.size(), 1U);
    EXPECT_EQ(fake_.printToolAgent.commands.size(), 1U);
    EXPECT_EQ(controller_.exitStatus(), 0U);
    EXPECT_EQ(fake_.imageDevices.announcements, 1);
}

TEST_F(SoftwareOffer, MayBeAnsweredByTheInstallerAtOnce) {
    offerPackages("Winjet", 1);
    fake_.installer.onStart = [](FakeInstaller& installer) {
        installer.delegate->predicateInstallDidComplete();
    };
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);
    EXPECT_EQ(failuresOf(usbURI("Winjet")), 2);
    EXPECT_EQ(controller_.exitStatus(), 0U);
}

TEST_F(SoftwareOffer, EndsAsTheInstallerFirstSaysWhenItSaysMore) {
    offerPackages("Winjet", 1);
    fake_.installer.onStart = [](FakeInstaller& installer) {
        installer.delegate->predicateInstallDidComplete();
        installer.delegate->predicateInstallUserDidCancel();
        installer.delegate->predicateInstallDidFailWithError(5);
        installer.delegate->predicateInstallDidComplete();
    };
    EXPECT_EQ(run({attach(kPlace, "Winjet")}), 0);
    EXPECT_EQ(failuresOf(usbURI("Winjet")), 2);
    EXPECT_EQ(controller_.exitStatus(), 0U);
}

TEST_F(SoftwareOffer, ThatCompletesWithNothingOfferedEndsTheRun) {
    fake_.installer.delegate->predicateInstallDidComplete();
    EXPECT_TRUE(controller_.done());
    EXPECT_EQ(controller_.exitStatus(), ~std::uint64_t{0});
    EXPECT_EQ(fake_.imageDevices.announcements, 0);
}

TEST_F(SoftwareOffer, IsReplacedByANotificationForEachUsbPrinterInSkerrowMode) {
    offerPackages("Winjet", 1);
    offerPackages("Pagejet", 3);
    EXPECT_EQ(run({attach(kPlace, "Winjet"), attach(kOtherPlace, "Pagejet"), "--skerrow"}), 0);
    EXPECT_EQ(controller_.exitStatus(), 1U);
    EXPECT_EQ(fake_.installer.predicates.size(), 0U);

    auto posted = fake_.notifications.posted;
    ASSERT_EQ(posted.size(), 2U);
    if (findText(posted[0].second, "1284 DeviceID")->find("Winjet") == std::string::npos)
        std::swap(posted[0], posted[1]);
    EXPECT_EQ(posted[0].first, "skerrowed-notification");
    EXPECT_EQ(posted[0].second, (PropertyDictionary{{"1284 DeviceID", "MFG:Acme;MDL:Winjet;CMD:GDI;SN:1;"},
                                                    {"Match", std::int64_t{1}}}));
    EXPECT_EQ(posted[1].second, (PropertyDictionary{{"1284 DeviceID", "MFG:Acme;MDL:Pagejet;CMD:GDI;SN:1;"},
                                                    {"Match", std::int64_t{3}}}));
}

TEST_F(SoftwareOffer, InSkerrowModeKeepsTheStatusOfAFailure) {
    EXPECT_EQ(run({attach(kPlace, "Winjet"), "x--skerrow", "ipp://127.0.0.1:1/"}), 0);
    EXPECT_EQ(controller_.exitStatus(), 255U);
    ASSERT_EQ(fake_.notifications.posted.size(), 1U);
    EXPECT_EQ(fake_.notifications.posted[0].second.at("Match"), PropertyValue(std::int64_t{0}));
}

TEST_F(SoftwareOffer, IsNotMadeInSkerrowModeThoughAnotherPrinterHasAPackage) {
    EXPECT_EQ(run({"--skerrow"}), -1);  // the mode stays with the controller
    fake_.printToolAgent.otherwise = {0, {{"count", std::int64_t{1}}}};
    DownloadTriggerOperation download(controller_, fake_.platform);
    download.addPrinterForSoftwareUpdate(std::make_shared<FakeDevice>("Netjet", scanID("Netjet")));
    controller_.operationCompleted(download);
    EXPECT_EQ(fake_.notifications.posted.size(), 0U);
    EXPECT_EQ(fake_.installer.predicates.size(), 0U);
    EXPECT_EQ(controller_.exitStatus(), 1U);
}

TEST_F(SoftwareOffer, TellsTheInstallerItsSettingsAndItsDelegateFromTheStart) {
    EXPECT_EQ(fake_.installer.settings->helpAnchor, "mh28042");
    ASSERT_NE(fake_.installer.delegate, nullptr);
    {
        const VentrasController another(fake_.platform, drivers_);
        EXPECT_NE(fake_.installer.delegate, nullptr);
    }
    EXPECT_EQ(fake_.installer.delegate, nullptr);  // nobody is called who is no longer there
}

}  // namespace
}  // namespace ventras
