#include "platform/linux/usb/LibusbRegistry.h"

#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <random>
#include <string>

#include "devices/UsbInterfaceReader.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/UsbBench.h"
#include "tests/usb/AttachedPrinters.h"
#include "tests/usb/FakeUsbRegistry.h"
#include "tests/usb/FaultyAnswers.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;

constexpr uid_t kNobody = 65534;
constexpr auto kWait = 200ms;

class Libusb : public testing::Test {
protected:
    std::unique_ptr<UsbInterfaceHandle> openFirst() { return openFirstPrinter(registry); }

    std::optional<std::string> firstDeviceID() {
        return UsbInterfaceReader(registry).readDeviceID(*allPrinters(registry).at(0));
    }

    std::vector<std::pair<std::uint32_t, int>> places() { return printerPlaces(registry); }

    UsbBench bench;
    LibusbRegistry registry;
};

// Listing -----------------------------------------------------------------------------------------

TEST_F(Libusb, FindsNothingWhereNothingIs) {
    EXPECT_THAT(places(), IsEmpty());
}

TEST_F(Libusb, LocatesPrintersByBusAndPorts) {
    for (const auto* place : {"2-1.3.2", "1-4", "3-1.2.3.4.5.6", "1-15", "11-9"})
        bench.plugIn(place);
    EXPECT_THAT(places(),
                ElementsAre(std::pair{0x01400000, 0}, std::pair{0x01F00000, 0}, std::pair{0x02132000, 0},
                            std::pair{0x03123456, 0}, std::pair{0x0B900000, 0}));
}

TEST_F(Libusb, KeepsTheLowestDigitOfAPortBeyond15) {
    bench.plugIn("1-18.3");
    EXPECT_THAT(places(), ElementsAre(std::pair{0x01230000, 0}));
}

TEST_F(Libusb, ListsEachPrinterInterfaceOnceWhateverSettingItIsIn) {
    bench.plugIn(
        "1-1",
        {.settings = {
             {0, 0, 0xFF, 0, 0}, {1, 0, 7, 1, 1}, {1, 1, 7, 1, 2}, {2, 0, 0xFF, 1, 4}, {2, 3, 7, 1, 4}}});
    EXPECT_THAT(places(), ElementsAre(std::pair{0x01100000, 1}, std::pair{0x01100000, 2}));
}

TEST_F(Libusb, DoesNotListWhatIsNoPrinterOrNotConfigured) {
    bench.plugIn("1-1", {.settings = {{0, 0, 8, 6, 80}}});
    bench.plugIn("1-2", {.settings = {{0, 0, 7, 2, 2}}});
    bench.plugIn("1-3", {.configuration = 0});
    EXPECT_THAT(places(), IsEmpty());
}

TEST_F(Libusb, SeesPrintersComeAndGo) {
    bench.plugIn("1-1");
    EXPECT_THAT(places(), ElementsAre(std::pair{0x01100000, 0}));
    bench.plugIn("1-2");
    comesTrue([&] { return places().size() >= 2; }, 5s);
    EXPECT_THAT(places(), ElementsAre(std::pair{0x01100000, 0}, std::pair{0x01200000, 0}));
    bench.unplug("1-1");
    comesTrue([&] { return places().size() <= 1; }, 5s);
    EXPECT_THAT(places(), ElementsAre(std::pair{0x01200000, 0}));
}

TEST_F(Libusb, OpensNoDeviceForLookingAtIt) {
    bench.plugIn("1-1", {.settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}});
    UsbInterfaceReader reader(registry);
    const auto services = allPrinters(registry);
    EXPECT_THAT(reader.readIdentity(*services.at(0)).location, Optional(0x01100000U));
    EXPECT_THAT(reader.listIPPOverUSBInterfaces(*services.at(0), std::nullopt), Optional("07-01-02-01"s));
    EXPECT_EQ(bench.node("1-1").timesOpened(), 0);
}

TEST_F(Libusb, OpensOnlyTheDeviceThatIsAskedAndClosesItAgain) {
    bench.plugIn("1-1");
    bench.plugIn("1-2");
    EXPECT_TRUE(firstDeviceID());
    EXPECT_EQ(bench.node("1-1").timesOpened(), 1);
    EXPECT_EQ(bench.node("1-2").timesOpened(), 0);
    comesTrue([&] { return bench.node("1-1").openAtPresent() == 0; }, 5s);
    EXPECT_EQ(bench.node("1-1").openAtPresent(), 0);
}

// What an interface is ----------------------------------------------------------------------------

TEST_F(Libusb, TellsWhatAnInterfaceIs) {
    bench.plugIn("1-1", {.vendor = 1008, .product = 17, .settings = {{3, 0, 7, 1, 2}}, .configuration = 2});
    const auto interface = openFirst();
    EXPECT_THAT(registry.deviceVendor(*interface), Optional(1008));
    EXPECT_THAT(registry.deviceProduct(*interface), Optional(17));
    EXPECT_THAT(registry.interfaceNumber(*interface), Optional(3));
    EXPECT_THAT(registry.configurationValue(*interface), Optional(2));
    EXPECT_THAT(registry.interfaceClass(*interface), Optional(7));
    EXPECT_THAT(registry.interfaceSubClass(*interface), Optional(1));
    EXPECT_THAT(registry.interfaceProtocol(*interface), Optional(2));
    EXPECT_THAT(registry.alternateSetting(*interface), Optional(0));
}

TEST_F(Libusb, TellsTheCurrentSetting) {
    auto& printer = bench.plugIn("1-1", {.settings = {{0, 0, 7, 1, 1}, {0, 1, 7, 1, 2}, {0, 2, 7, 1, 4}}});
    printer.control({0x01, 11, 2, 0, 0});
    bench.node("1-1").onSetInterface(0, 2);
    const auto interface = openFirst();
    EXPECT_THAT(registry.interfaceProtocol(*interface), Optional(4));
    EXPECT_THAT(registry.alternateSetting(*interface), Optional(2));
}

TEST_F(Libusb, NamesTheFirstPrinterSettingWhereTheCurrentOneIsNone) {
    bench.plugIn("1-1", {.settings = {{0, 0, 0xFF, 0, 0}, {0, 1, 7, 1, 2}, {0, 2, 7, 1, 4}}});
    const auto interface = openFirst();
    EXPECT_THAT(registry.interfaceClass(*interface), Optional(0xFF));
    EXPECT_THAT(registry.alternateSetting(*interface), Optional(1));
    EXPECT_THAT(firstDeviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
}

TEST_F(Libusb, WalksTheSettingsInTheirOrder) {
    bench.plugIn("1-1",
                 {.settings = {{0, 0, 7, 1, 1}, {0, 5, 7, 1, 4}, {0, 2, 0xFF, 3, 2}, {1, 0, 7, 1, 4}}});
    const auto interface = openFirst();
    std::vector<UsbInterfaceDescriptor> found;
    const UsbInterfaceDescriptor* setting = nullptr;
    while ((setting = registry.nextInterfaceDescriptor(*interface, setting)) != nullptr)
        found.push_back(*setting);
    EXPECT_THAT(found, ElementsAre(UsbInterfaceDescriptor{0, 7, 1, 1}, UsbInterfaceDescriptor{5, 7, 1, 4},
                                   UsbInterfaceDescriptor{2, 0xFF, 3, 2}));
}

TEST_F(Libusb, ListsEveryInterfaceOfADevice) {
    bench.plugIn("1-1", {.settings = {{0, 0, 7, 1, 1}, {1, 0, 8, 6, 80}, {4, 0, 0xFF, 1, 4}}});
    const auto interface = openFirst();
    const auto device = registry.openDevice(*registry.deviceOfInterface(*interface));
    const auto iterator = registry.interfacesOfDevice(*device);
    std::vector<int> numbers;
    while (const auto sibling = registry.nextInterface(*iterator))
        numbers.push_back(registry.interfaceNumber(*registry.openInterface(*sibling)).value());
    EXPECT_THAT(numbers, ElementsAre(0, 1, 4));
}

// Requests ----------------------------------------------------------------------------------------

TEST_F(Libusb, ReadsTheDeviceIDWhileTheKernelsDriverHasThePrinter) {
    bench.plugIn("1-1");
    bench.node("1-1").bindDriver(0, "usblp");
    EXPECT_THAT(firstDeviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
    EXPECT_EQ(bench.node("1-1").driver(0), "usblp");
    EXPECT_FALSE(bench.node("1-1").isClaimed(0));
}

TEST_F(Libusb, ReadsTheIDOfTheInterfaceThatIsAsked) {
    bench.plugIn("1-1", {.deviceIDs = {{1, "MFG:Example;MDL:Fax;SN:F;"}},
                         .settings = {{0, 0, 7, 1, 2}, {1, 0, 7, 1, 2}}});
    UsbInterfaceReader reader(registry);
    EXPECT_THAT(reader.readDeviceID(*allPrinters(registry).at(1)), Optional("MFG:Example;MDL:Fax;SN:F;"s));
}

TEST_F(Libusb, TellsHowARequestEnded) {
    auto& printer = bench.plugIn("1-1");
    for (const auto& fault : faultyAnswers(kWait)) {
        printer.fault = [answer = fault.answer](const UsbSetup&) { return std::optional{answer}; };
        const auto interface = openFirst();
        auto request = getDeviceID(256, kWait);
        EXPECT_EQ(registry.controlRequest(*interface, request), fault.status) << fault.name;
        EXPECT_EQ(request.bytesTransferred, fault.bytes) << fault.name;
        EXPECT_EQ(request.data.size(), 256U) << fault.name;
    }
}

TEST_F(Libusb, WaitsNoLongerThanItIsTold) {
    bench.plugIn("1-1").fault = [](const UsbSetup&) { return std::optional{UsbAnswer::silence()}; };
    const auto interface = openFirst();
    for (const auto& [noData, completion] :
         {std::pair{60ms, 0ms}, std::pair{0ms, 60ms}, std::pair{60ms, 5000ms}}) {
        auto request = getDeviceID(2, noData);
        request.completionTimeOut = completion;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(registry.controlRequest(*interface, request), UsbStatus::kTimeOut);
        const auto waited = std::chrono::steady_clock::now() - start;
        EXPECT_GE(waited, 55ms);
        EXPECT_LT(waited, 2000ms);
    }
}

TEST_F(Libusb, AsksForWhatUsbfsCanMoveOfALongerID) {
    const std::string id = "MFG:Example;MDL:Laser;SN:A1;" + std::string(65000, 'x');
    auto& printer = bench.plugIn("1-1", {.deviceID = id});
    EXPECT_THAT(firstDeviceID(), Optional(id.substr(0, 4094)));
    ASSERT_EQ(printer.requests().size(), 2U);
    EXPECT_EQ(printer.requests()[1].wLength, 4096);
}

TEST_F(Libusb, ReadsAnIDWithSwappedLengthBytes) {
    const std::string id = "MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;";
    bench.plugIn("1-1").fault = [id](const UsbSetup& setup) {
        return isGetDeviceID(setup)
                   ? std::optional{UsbAnswer::deviceID(static_cast<std::uint16_t>((id.size() + 2) << 8U), id)}
                   : std::nullopt;
    };
    EXPECT_THAT(firstDeviceID(), Optional(id));
}

TEST_F(Libusb, FindsNoDeviceOnceItIsGone) {
    bench.plugIn("1-1");
    const auto services = allPrinters(registry);
    const auto opened = registry.openInterface(*services.at(0));
    auto request = getDeviceID(256, kWait);
    EXPECT_EQ(registry.controlRequest(*opened, request), UsbStatus::kSuccess);
    bench.unplug("1-1");
    EXPECT_EQ(registry.controlRequest(*opened, request), UsbStatus::kNoDevice);
    EXPECT_EQ(UsbInterfaceReader(registry).readDeviceID(*services.at(0)), std::nullopt);
}

TEST_F(Libusb, SurvivesADeviceThatGoesBetweenTwoRequests) {
    bench.plugIn("1-1", {.deviceID = "CMD:PCL;", .manufacturer = "M", .productName = "P"}).fault =
        [count = 0](const UsbSetup&) mutable {
            return ++count > 2 ? std::optional{UsbAnswer{ESHUTDOWN, {}, {}}} : std::nullopt;
        };
    EXPECT_THAT(firstDeviceID(), Optional("CMD:PCL;"s));
}

/// Whether a printer whose node is closed to the user is listed, and refuses requests.
int lookAtForbiddenPrinterAsNobody(mode_t mode) {
    if (geteuid() == 0 && (setgid(kNobody) != 0 || setuid(kNobody) != 0))
        return 2;
    UsbBench bench;
    bench.plugIn("1-1");
    chmod(bench.nodeFile("1-1").c_str(), mode);
    LibusbRegistry registry;
    const auto services = allPrinters(registry);
    if (services.size() != 1)
        return 3;
    const auto interface = registry.openInterface(*services[0]);
    if (registry.interfaceLocation(*interface) != 0x01100000)
        return 4;
    auto request = getDeviceID(256, kWait);
    if (registry.controlRequest(*interface, request) != UsbStatus::kAccessDenied)
        return 5;
    return UsbInterfaceReader(registry).readDeviceID(*services[0]) ? 6 : 0;
}

TEST(LibusbAccess, DeniedLeavesAPrinterListedButSilent) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    for (const mode_t mode : {0U, 0444U})
        EXPECT_EXIT(_exit(lookAtForbiddenPrinterAsNobody(mode)), testing::ExitedWithCode(0), "");
}

// Against the registry in memory ------------------------------------------------------------------

/// A printer out of a seed: interfaces, settings, IDs and strings in all combinations.
FakePrinterModel randomModel(std::mt19937& random) {
    const auto below = [&](unsigned limit) {
        return std::uniform_int_distribution<unsigned>(0, limit - 1)(random);
    };
    const auto pick = [&](std::initializer_list<const char*> list) {
        return std::string(list.begin()[below(static_cast<unsigned>(list.size()))]);
    };
    FakePrinterModel model;
    model.settings.clear();
    const unsigned interfaces = 1 + below(3);
    for (unsigned number = 0; number < interfaces; ++number)
        for (unsigned alternate = 0; alternate <= below(3); ++alternate)
            model.settings.push_back({static_cast<std::uint8_t>(number), static_cast<std::uint8_t>(alternate),
                                      static_cast<std::uint8_t>(below(4) == 0 ? 0xFF : 7),
                                      static_cast<std::uint8_t>(1 + below(2)),
                                      static_cast<std::uint8_t>(1 + below(4))});
    model.settings.push_back({static_cast<std::uint8_t>(interfaces), 0, 7, 1, 2});
    model.deviceID = pick({"MFG:A;MDL:B;SN:C+1;", "MFG:A;", "CMD:PCL", "", "IPPE:07-01-04-00;MFG:A;"}) +
                     std::string(below(600), 'z');
    model.manufacturer = pick({"", "Example", "M\xc3\xbcller"});
    model.productName = pick({"", "Laser 9000"});
    model.serialNumber = pick({"", "S+1", "\xe4\xbd\x83"});
    return model;
}

TEST_F(Libusb, AgreesWithTheRegistryInMemory) {
    std::mt19937 random(20261121);
    for (int round = 0; round < 25; ++round) {
        const auto model = randomModel(random);
        FakeUsbRegistry memory;
        memory.attach(0x01100000, model);
        bench.plugIn("1-1", model);
        LibusbRegistry real;
        const auto expected = allPrinters(memory);
        const auto found = allPrinters(real);
        ASSERT_EQ(found.size(), expected.size()) << "round " << round;
        for (std::size_t i = 0; i < found.size(); ++i) {
            // The two choose differently where an interface is in no printer setting.
            const auto current = memory.interfaceClass(*memory.openInterface(*expected[i]));
            if (current != 7 || memory.interfaceSubClass(*memory.openInterface(*expected[i])) != 1)
                continue;
            const auto id = UsbInterfaceReader(real).readDeviceID(*found[i]);
            EXPECT_EQ(id, UsbInterfaceReader(memory).readDeviceID(*expected[i])) << "round " << round;
            EXPECT_EQ(UsbInterfaceReader(real).listIPPOverUSBInterfaces(*found[i], id),
                      UsbInterfaceReader(memory).listIPPOverUSBInterfaces(*expected[i], id))
                << "round " << round;
        }
        bench.unplug("1-1");
    }
}

}  // namespace
}  // namespace ventras
