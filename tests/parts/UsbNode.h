#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>

#include "tests/parts/FakePrinter.h"

struct _GObject;
struct _UMockdevIoctlBase;
struct _UMockdevIoctlClient;
struct _UMockdevIoctlData;

namespace ventras {

/// A device node of usbfs with a FakePrinter behind it, and the kernel's rules about who may send what:
/// claims, its own printer driver, which requests need a claim. umockdev calls it on a thread of its own; any
/// thread may ask.
class UsbNode {
public:
    explicit UsbNode(FakePrinter& printer);
    UsbNode(const UsbNode&) = delete;
    UsbNode& operator=(const UsbNode&) = delete;
    ~UsbNode();

    /// The handler to attach to the node.
    _UMockdevIoctlBase* handler() const { return handler_; }

    /// Called when an interface changes to another setting. Set it before the device is used.
    std::function<void(std::uint8_t interface, std::uint8_t alternate)> onSetInterface;

    /// Puts the kernel's printer driver, or none ("") on an interface.
    void bindDriver(std::uint8_t interface, const std::string& driver);
    std::string driver(std::uint8_t interface) const;

    /// The device is gone: transfers end, new ones fail.
    void unplug();

    bool isClaimed(std::uint8_t interface) const;
    int timesOpened() const;
    int openAtPresent() const;

private:
    struct Transfer;
    using Client = _UMockdevIoctlClient*;

    static int handleIoctl(_UMockdevIoctlBase* base, Client client, void* self);
    static void clientConnected(_UMockdevIoctlBase* base, Client client, void* self);
    static void clientGone(void* self, _GObject* client);

    int perform(Client client, unsigned long request, _UMockdevIoctlData* argument);
    int claim(Client client, std::uint8_t interface, bool detach);
    int release(Client client, std::uint8_t interface);
    int driverRequest(std::uint8_t interface, unsigned request);
    int submit(Client client, _UMockdevIoctlData* urb);
    int refusal(Client client, const UsbSetup& setup) const;
    void advance(Transfer& transfer);
    bool reap(Client client, _UMockdevIoctlData* argument);
    int discard(unsigned long address);

    FakePrinter& printer_;
    _UMockdevIoctlBase* handler_;
    mutable std::mutex mutex_;
    bool gone_ = false;
    int timesOpened_ = 0;
    std::set<Client> clients_;
    std::map<std::uint8_t, std::string> drivers_;
    std::map<std::uint8_t, Client> claims_;
    std::list<std::unique_ptr<Transfer>> transfers_;
};

}  // namespace ventras
