#include "queues/QueueCreation.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <fstream>
#include <future>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "platform/PropertyList.h"
#include "queues/QueueInventory.h"
#include "queues/QueueLock.h"
#include "tests/devices/FakeDevice.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using Name = std::optional<std::string>;

// A computer whose scheduler is down: the queues that exist are those of its saved list.
class Creation : public testing::Test {
protected:
    Creation() { fake_.processes.processes.clear(); }

    void existing(const std::vector<PropertyDictionary>& queues) {
        folder_.write("printers.plist", *xmlPropertyList(PropertyArray(queues.begin(), queues.end())));
    }

    QueueCreationResult create(const QueueAttributes& attributes, const Name& name = "Office",
                               const Name& location = std::nullopt,
                               DefaultPrinter defaultPrinter = DefaultPrinter::Keep) {
        FakeDevice device(name);
        testing::internal::CaptureStdout();
        auto result = creation_.createQueue(location, attributes, defaultPrinter, device);
        output_ = testing::internal::GetCapturedStdout();
        return result;
    }
    QueueCreationResult createFor(const std::string& uri) { return create({{"Printer URI", uri}}); }

    // Whether the lock is free; asked on a thread of its own, as its owner may not ask.
    static bool lockIsFree() {
        return std::async(std::launch::async,
                          [] {
                              const std::unique_lock lock(queueLock(), std::try_to_lock);
                              return lock.owns_lock();
                          })
            .get();
    }

    TemporaryFolder folder_;
    FakePlatform fake_;
    FakePrintSystem& printSystem_ = fake_.printSystem;
    QueueInventory inventory_{fake_.platform, folder_ / "printers.plist"};
    QueueCreation creation_{fake_.platform, inventory_};
    std::string output_;
};

const QueueAttributes kNetworkPrinter{{"Printer URI", "ipp://printer/"}, {"MODEL:", "Laser"}};

TEST_F(Creation, HandsTheAttributesAndTheDisplayNameToThePrintSystem) {
    const auto result = create(kNetworkPrinter, "HP LaserJet [12AB34]");
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.queueID, "HP_LaserJet");
    ASSERT_EQ(printSystem_.creations.size(), 1U);
    const auto& creation = printSystem_.creations[0];
    EXPECT_EQ(creation.queueID, "HP_LaserJet");
    EXPECT_EQ(creation.attributes, kNetworkPrinter);
    EXPECT_EQ(creation.options, (std::map<std::string, std::string>{{"PC WSItem User Name", "HP LaserJet"}}));
    EXPECT_EQ(printSystem_.removed, std::vector<std::string>{});
}

TEST_F(Creation, SaysWhichQueueItMade) {
    create(kNetworkPrinter);
    EXPECT_EQ(output_, "Queue ID:Office\n");
}

TEST_F(Creation, AddsTheLocationThatItIsGiven) {
    create({{"Printer URI", "ipp://x"}, {"Location", "from the device"}}, "Office", "Reading Room");
    create({{"Printer URI", "ipp://x"}, {"Location", "from the device"}}, "Office", std::nullopt);
    create({{"Printer URI", "ipp://x"}}, "Office", "");
    ASSERT_EQ(printSystem_.creations.size(), 3U);
    EXPECT_EQ(*findText(printSystem_.creations[0].attributes, "Location"), "Reading Room");
    EXPECT_EQ(*findText(printSystem_.creations[1].attributes, "Location"), "from the device");
    EXPECT_EQ(*findText(printSystem_.creations[2].attributes, "Location"), "");
}

TEST_F(Creation, HandsOnValuesThatAreNoTexts) {
    const QueueAttributes scanner{{"Printer URI", "quillon:x"}, {"Scanner", true}};
    create(scanner);
    EXPECT_EQ(printSystem_.creations.at(0).attributes, scanner);
}

TEST_F(Creation, MakesTheNameUnique) {
    printSystem_.taken = {"Office", "Unknown"};
    EXPECT_EQ(create(kNetworkPrinter).queueID, "Office_2");
    EXPECT_EQ(printSystem_.creations[0].options.at("PC WSItem User Name"), "Office 2");

    EXPECT_EQ(create(kNetworkPrinter, std::nullopt).queueID, "Unknown_2");
    EXPECT_EQ(printSystem_.creations[1].options.at("PC WSItem User Name"), "Unknown 2");
}

TEST_F(Creation, NamesTheQueueOfANamelessDeviceUnknown) {
    EXPECT_EQ(create(kNetworkPrinter, std::nullopt).queueID, "Unknown");
}

TEST_F(Creation, RemovesAQueueThatThePrintSystemRefuses) {
    printSystem_.create = [](const auto&) { return 73; };
    const auto result = create(kNetworkPrinter, "Office", std::nullopt, DefaultPrinter::BecomesNewQueue);
    EXPECT_EQ(result.status, 73);
    EXPECT_EQ(result.queueID, std::nullopt);
    EXPECT_EQ(printSystem_.removed, std::vector<std::string>{"Office"});
    EXPECT_EQ(printSystem_.defaults, std::vector<std::string>{});
    EXPECT_EQ(output_, "");
}

TEST_F(Creation, FailsWhenTheAttributesCannotBeSerialized) {
    for (const std::string text : {"\x01", "\xff", "a\x1b[0m"}) {
        const auto result = create({{"Printer URI", "ipp://x"}, {"MODEL:", text}});
        EXPECT_EQ(result.status, -30886) << text;
        EXPECT_EQ(result.queueID, std::nullopt) << text;
    }
    EXPECT_EQ(create(kNetworkPrinter, "Office", "a\x01").status, -30886);
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printSystem_.removed, std::vector<std::string>{});
}

TEST_F(Creation, FailsWhenTheLocalServerHasNoAddress) {
    printSystem_.serverURL.reset();
    EXPECT_EQ(create(kNetworkPrinter).status, -30886);
    EXPECT_EQ(printSystem_.creations.size(), 0U);
}

TEST_F(Creation, FailsWhenThePrintSystemSuggestsNoIdentifier) {
    printSystem_.suggestsNames = false;
    EXPECT_EQ(create(kNetworkPrinter).status, -620);
    EXPECT_EQ(create({{"Printer URI", "\x01"}}).status, -30886);  // the attributes are looked at first
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(printSystem_.removed, std::vector<std::string>{});
}

TEST_F(Creation, MakesOnlyAPrintersQueueTheDefaultAndOnlyWhenAsked) {
    struct Case {
        DefaultPrinter wanted;
        bool isFax, isScanner, becomesDefault;
    };
    constexpr Case kCases[] = {
        {DefaultPrinter::BecomesNewQueue, false, false, true},
        {DefaultPrinter::BecomesNewQueue, true, false, false},
        {DefaultPrinter::BecomesNewQueue, false, true, false},
        {DefaultPrinter::BecomesNewQueue, true, true, false},
        {DefaultPrinter::Keep, false, false, false},
    };
    for (const auto& [wanted, isFax, isScanner, becomesDefault] : kCases) {
        printSystem_.taken.clear();
        printSystem_.defaults.clear();
        printSystem_.faxQueues = isFax ? std::set<std::string>{"Office"} : std::set<std::string>{};
        printSystem_.scannerQueues = isScanner ? std::set<std::string>{"Office"} : std::set<std::string>{};
        EXPECT_EQ(create(kNetworkPrinter, "Office", std::nullopt, wanted).status, 0);
        EXPECT_EQ(printSystem_.defaults, std::vector<std::string>(becomesDefault ? 1 : 0, "Office"))
            << isFax << isScanner;
    }
}

TEST_F(Creation, DoesNotAskWhetherANetworkPrinterHasAQueue) {
    for (const std::string uri : {"ipp://printer/", "ipps://printer/", "dnssd://printer/",
                                  "ippusb://printer/", "usb:/Acme/Laser", "USB://Acme/Laser", ""}) {
        existing({{{"printer-name", "old"}, {"device-uri", uri}, {"printer-type", std::int64_t{4}}}});
        EXPECT_EQ(createFor(uri).status, 0) << uri;
    }
    EXPECT_EQ(create({}).status, 0);
}

// The URI of a USB device that no other test, run at the same time, uses.
std::string usbURI(const std::string& model = "Laser") {
    return "usb://Acme/" + model + "?serial=" + std::to_string(getpid());
}

/// Another process's guard file, deleted with its owner.
class GuardFile {
public:
    explicit GuardFile(std::string path) : path_(std::move(path)) { std::ofstream{path_}; }
    ~GuardFile() { unlink(path_.c_str()); }
    GuardFile(const GuardFile&) = delete;
    GuardFile& operator=(const GuardFile&) = delete;

    bool exists() const { return access(path_.c_str(), F_OK) == 0; }

private:
    std::string path_;
};

TEST_F(Creation, MakesAQueueForAUsbDeviceAndLeavesNoGuardFile) {
    EXPECT_EQ(createFor(usbURI()).status, 0);
    EXPECT_NE(access(("/tmp/usb:..Acme.Laser.serial=" + std::to_string(getpid())).c_str(), F_OK), 0);
}

TEST_F(Creation, GivesTheNameOfTheQueueThatAUsbDeviceHas) {
    existing({{{"printer-name", "old"}, {"device-uri", usbURI()}},
              {{"printer-name", "b"}, {"device-uri", usbURI()}}});
    const auto result = createFor(usbURI());
    EXPECT_EQ(result.status, 242);
    EXPECT_EQ(result.queueID, "old");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_EQ(output_, "");
}

TEST_F(Creation, GivesAnEmptyNameForAUsbDevicesQueueThatHasNone) {
    existing({{{"device-uri", usbURI()}}});
    const auto result = createFor(usbURI());
    EXPECT_EQ(result.status, 242);
    EXPECT_EQ(result.queueID, "");
}

TEST_F(Creation, LeavesAUsbDeviceToTheProcessThatHoldsItsGuard) {
    existing({{{"printer-name", "old"}, {"device-uri", usbURI()}}});
    const GuardFile guard("/tmp/usb:..Acme.Laser.serial=" + std::to_string(getpid()));
    const auto result = createFor(usbURI());
    EXPECT_EQ(result.status, 242);
    EXPECT_EQ(result.queueID, std::nullopt);
    EXPECT_EQ(printSystem_.creations.size(), 0U);
    EXPECT_TRUE(guard.exists());
    EXPECT_EQ(createFor(usbURI("Other")).status, 0);
}

TEST_F(Creation, DoesNotFollowALinkInPlaceOfTheGuard) {
    const auto path = "/tmp/usb:..Acme.Link.serial=" + std::to_string(getpid());
    const auto target = folder_ / "target";
    ASSERT_EQ(symlink(target.c_str(), path.c_str()), 0);
    const auto status = createFor(usbURI("Link")).status;
    unlink(path.c_str());
    EXPECT_EQ(status, 242);
    EXPECT_FALSE(std::filesystem::exists(target));
}

TEST_F(Creation, TakesAGuardThatTheFileSystemRefusesForOneThatAnotherHolds) {
    EXPECT_EQ(createFor("usb://Acme/" + std::string(300, 'x')).status, 242);
}

TEST_F(Creation, GoesOnUnguardedWhenTheGuardsNameIsTooLong) {
    const auto uri = usbURI(std::string(1100, 'x'));
    existing({{{"printer-name", "old"}, {"device-uri", uri}}});
    EXPECT_EQ(createFor(uri).status, 0);
}

TEST_F(Creation, GoesOnUnguardedWhenTheGuardsNameIsNotUtf8) {
    EXPECT_EQ(createFor("usb://Acme/\xff").status,
              -30886);  // no guard stops it; the print system never sees it
}

TEST_F(Creation, HoldsTheQueueLockWhileThePrintSystemMakesTheQueue) {
    bool wasFree = true;
    printSystem_.create = [&](const auto&) {
        wasFree = lockIsFree();
        return 0;
    };
    create(kNetworkPrinter);
    EXPECT_FALSE(wasFree);
}

TEST_F(Creation, ReleasesTheQueueLockOnEveryPath) {
    EXPECT_EQ(create(kNetworkPrinter).status, 0);
    EXPECT_TRUE(lockIsFree());
    printSystem_.create = [](const auto&) { return 73; };
    EXPECT_EQ(create(kNetworkPrinter).status, 73);
    EXPECT_TRUE(lockIsFree());
    existing({{{"printer-name", "old"}, {"device-uri", usbURI()}}});
    EXPECT_EQ(createFor(usbURI()).status, 242);
    EXPECT_TRUE(lockIsFree());
    printSystem_.suggestsNames = false;
    EXPECT_EQ(create(kNetworkPrinter).status, -620);
    EXPECT_TRUE(lockIsFree());
}

TEST_F(Creation, GivesDevicesOfOneNameMatchingNamesAndIdentifiersWhenMadeAtOnce) {
    constexpr int kDevices = 16;
    testing::internal::CaptureStdout();
    {
        std::vector<std::jthread> threads;
        for (int i = 0; i < kDevices; ++i)
            threads.emplace_back([this] {
                FakeDevice device("Office");
                EXPECT_EQ(
                    creation_.createQueue(std::nullopt, kNetworkPrinter, DefaultPrinter::Keep, device).status,
                    0);
            });
    }
    testing::internal::GetCapturedStdout();
    std::set<std::string> identifiers;
    for (const auto& creation : printSystem_.creations) {
        identifiers.insert(creation.queueID);
        const auto suffix = creation.queueID.substr(std::string("Office").size());
        EXPECT_EQ(creation.options.at("PC WSItem User Name"),
                  suffix.empty() ? "Office" : "Office " + suffix.substr(1));
    }
    EXPECT_EQ(identifiers.size(), static_cast<std::size_t>(kDevices));
}

}  // namespace
}  // namespace ventras
