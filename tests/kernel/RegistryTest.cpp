#include <gmock/gmock.h>
#include <sys/inotify.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <chrono>
#include <optional>
#include <string>
#include <thread>

#include "devices/UsbInterfaceReader.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/usb/LibusbRegistry.h"
#include "tests/kernel/VhciPort.h"
#include "tests/parts/ComesTrue.h"
#include "tests/usb/AttachedPrinters.h"
#include "tests/usb/FaultyAnswers.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using testing::ElementsAre;
using testing::Gt;
using testing::IsEmpty;
using testing::Optional;

constexpr auto kWait = 1s;
constexpr uid_t kNobody = 65534;

/// Counts from now on how often a file is opened.
class OpenWatch {
public:
    explicit OpenWatch(const std::filesystem::path& file) : events_(inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
        EXPECT_GE(inotify_add_watch(events_.get(), file.c_str(), IN_OPEN), 0) << file;
    }

    long count() {
        std::array<inotify_event, 64> events{};
        const auto size = read(events_.get(), events.data(), sizeof events);
        count_ += size > 0 ? size / static_cast<ssize_t>(sizeof(inotify_event)) : 0;
        return count_;
    }

private:
    FileDescriptor events_;
    long count_ = 0;
};

class KernelRegistry : public testing::Test {
protected:
    std::optional<std::string> firstDeviceID() {
        return UsbInterfaceReader(registry).readDeviceID(*allPrinters(registry).at(0));
    }

    LibusbRegistry registry;
};

TEST_F(KernelRegistry, FindsNothingWhereNothingIsPluggedIn) {
    EXPECT_THAT(printerPlaces(registry), IsEmpty());
}

TEST_F(KernelRegistry, LocatesPrintersByBusAndPort) {
    const VhciPort fifth({}, 5);
    const VhciPort first({.settings = {{0, 0, 0xFF, 0, 0}, {1, 0, 7, 1, 2}}});
    EXPECT_THAT(printerPlaces(registry), ElementsAre(std::pair{0x01100000, 1}, std::pair{0x01500000, 0}));
}

TEST_F(KernelRegistry, ReadsTheDeviceIDWhileTheKernelsDriverHasThePrinter) {
    const VhciPort port;
    ASSERT_EQ(port.driver(0), "usblp");
    EXPECT_THAT(firstDeviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
    EXPECT_EQ(port.driver(0), "usblp");
}

TEST_F(KernelRegistry, AsksAgainForAnIDThatIsLongerThanTheFirstRequest) {
    const auto id = "MFG:Example;MDL:Laser;SN:A1;CMD:" + std::string(300, 'x') + ";";
    VhciPort port({.deviceID = id});
    const auto before = port.printer().requests().size();
    EXPECT_THAT(firstDeviceID(), Optional(id));
    const auto requests = port.printer().requests();
    ASSERT_EQ(requests.size(), before + 2);
    EXPECT_EQ(requests[before].wLength, 256);
    EXPECT_EQ(requests[before + 1].wLength, id.size() + 2);
}

TEST_F(KernelRegistry, CompletesAnIDFromTheStringDescriptors) {
    const VhciPort port({.deviceID = "CMD:PCL;", .manufacturer = "D\u00e9j\u00e0", .productName = "Vu 1"});
    EXPECT_THAT(firstDeviceID(),
                Optional(testing::AllOf(testing::HasSubstr("CMD:PCL;"), testing::HasSubstr("MDL:Vu 1;"))));
}

TEST_F(KernelRegistry, ReadsTheIDOfASettingThatIsNotTheCurrentOne) {
    const VhciPort port({.settings = {{0, 0, 0xFF, 0, 0}, {0, 1, 7, 1, 2}}});
    ASSERT_EQ(port.driver(0), "");
    EXPECT_THAT(firstDeviceID(), Optional("MFG:Example;MDL:Laser 9000;CMD:PCL,PJL;SN:A1;"s));
}

TEST_F(KernelRegistry, TellsHowARequestEnded) {
    VhciPort port;
    const auto interface = openFirstPrinter(registry);
    for (const auto& fault : faultyAnswers(kWait)) {
        port.printer().fault = [answer = fault.answer](const UsbSetup&) { return std::optional{answer}; };
        const auto before = port.takenBack();
        auto request = getDeviceID(256, kWait);
        EXPECT_EQ(registry.controlRequest(*interface, request), fault.status) << fault.name;
        EXPECT_EQ(request.bytesTransferred, fault.bytes) << fault.name;
        // What nobody waits for any more is not left with the device.
        EXPECT_EQ(port.takenBack() - before, fault.status == UsbStatus::kTimeOut ? 1 : 0) << fault.name;
    }
    EXPECT_EQ(port.driver(0), "usblp");
}

TEST_F(KernelRegistry, EndsARequestAtOnceWhenThePrinterIsUnplugged) {
    std::optional<VhciPort> port(std::in_place);
    const auto interface = openFirstPrinter(registry);
    std::atomic<bool> isAsked = false;
    port->printer().fault = [&](const UsbSetup&) {
        isAsked = true;
        return std::optional{UsbAnswer::silence()};
    };
    std::thread unplugger([&] {
        EXPECT_TRUE(comesTrue([&] { return isAsked.load(); }, 60s));
        port.reset();
    });
    auto request = getDeviceID(256, 60s);
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(registry.controlRequest(*interface, request), UsbStatus::kNoDevice);
    EXPECT_LT(std::chrono::steady_clock::now() - start, 10s);
    isAsked = true;
    unplugger.join();
    EXPECT_EQ(registry.controlRequest(*interface, request), UsbStatus::kNoDevice);
}

TEST_F(KernelRegistry, LooksAtASettingForIppOverUsbWithoutOpeningTheDevice) {
    VhciPort port({.settings = {{0, 0, 7, 1, 2}, {0, 1, 7, 1, 4}}});
    OpenWatch opened(port.nodePath());
    const auto requests = port.printer().requests().size();
    UsbInterfaceReader reader(registry);
    const auto printers = allPrinters(registry);
    ASSERT_EQ(printers.size(), 1U);
    EXPECT_THAT(reader.readIdentity(*printers[0]).location, Optional(0x01100000U));
    EXPECT_THAT(reader.listIPPOverUSBInterfaces(*printers[0], std::nullopt), Optional("07-01-02-01"s));
    EXPECT_EQ(opened.count(), 0);
    EXPECT_EQ(port.printer().requests().size(), requests);
    // The watch itself works.
    EXPECT_TRUE(reader.readDeviceID(*printers[0]));
    EXPECT_THAT(opened.count(), Gt(0));
}

/// Whether a printer is listed, and refuses requests, as it should to an ordinary user.
int lookAtForbiddenPrinter() {
    if (setgid(kNobody) != 0 || setuid(kNobody) != 0)
        return 2;
    LibusbRegistry registry;
    if (printerPlaces(registry) != std::vector<std::pair<std::uint32_t, int>>{{0x01100000, 0}})
        return 3;
    auto request = getDeviceID(256, kWait);
    return registry.controlRequest(*openFirstPrinter(registry), request) == UsbStatus::kAccessDenied ? 0 : 4;
}

TEST_F(KernelRegistry, ListsAPrinterThatTheUserMayNotAsk) {
    const VhciPort port;
    const pid_t child = fork();
    if (child == 0)
        _exit(lookAtForbiddenPrinter());
    int status = -1;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 0);
}

}  // namespace
}  // namespace ventras
