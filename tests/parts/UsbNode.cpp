#include "tests/parts/UsbNode.h"

#include <sys/ioctl.h>
// usbdevice_fs.h uses what ioctl.h defines.
#include <linux/usb/ch9.h>
#include <linux/usbdevice_fs.h>
#include <umockdev.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <string_view>
#include <utility>

#include "tests/parts/UsbTransfer.h"

namespace ventras {
namespace {

// The node of the bench is a plain file, always ready: without a pause its users would spin while they wait.
constexpr guint kPauseMilliseconds = 5;

constexpr std::uint8_t kRecipientMask = 0x1F;
constexpr std::uint8_t kToInterface = 0x01;
constexpr std::uint8_t kToEndpoint = 0x02;
constexpr std::size_t kSetupLength = 8;

template <class Value>
Value& valueIn(UMockdevIoctlData* data) {
    return *reinterpret_cast<Value*>(data->data);
}

struct LateAnswer {
    UMockdevIoctlClient* client;
};

gboolean answerTryAgain(gpointer data) {
    const std::unique_ptr<LateAnswer> answer{static_cast<LateAnswer*>(data)};
    umockdev_ioctl_client_complete(answer->client, -1, EAGAIN);
    g_object_unref(answer->client);
    return G_SOURCE_REMOVE;
}

void tryAgainLater(UMockdevIoctlClient* client) {
    g_object_ref(client);
    GSource* source = g_timeout_source_new(kPauseMilliseconds);
    g_source_set_callback(source, answerTryAgain, new LateAnswer{client}, nullptr);
    g_source_attach(source, g_main_context_get_thread_default());
    g_source_unref(source);
}

}  // namespace

struct UsbNode::Transfer {
    Transfer(Client user, UMockdevIoctlData* submitted) : client(user), urb(submitted) { g_object_ref(urb); }
    ~Transfer() { g_object_unref(urb); }
    Transfer(const Transfer&) = delete;
    Transfer& operator=(const Transfer&) = delete;

    usbdevfs_urb& header() { return valueIn<usbdevfs_urb>(urb); }

    void finish(int error, std::size_t length) {
        header().status = -error;
        header().actual_length = static_cast<int>(length);
        done = true;
    }

    Client client;
    UMockdevIoctlData* urb;
    UMockdevIoctlData* buffer = nullptr;
    std::optional<UsbTransfer> progress;
    bool done = false;
};

UsbNode::UsbNode(FakePrinter& printer) : printer_(printer), handler_(umockdev_ioctl_base_new()) {
    // umockdev's thread takes this lock first and so finds everything that was made before it.
    const std::lock_guard lock(mutex_);
    g_signal_connect(handler_, "handle-ioctl", G_CALLBACK(handleIoctl), this);
    g_signal_connect(handler_, "client-connected", G_CALLBACK(clientConnected), this);
}

UsbNode::~UsbNode() {
    const std::lock_guard lock(mutex_);
    g_signal_handlers_disconnect_by_data(handler_, this);
    for (auto* client : clients_)
        g_object_weak_unref(G_OBJECT(client), clientGone, this);
    g_object_unref(handler_);
}

void UsbNode::bindDriver(std::uint8_t interface, const std::string& driver) {
    const std::lock_guard lock(mutex_);
    drivers_[interface] = driver;
}

std::string UsbNode::driver(std::uint8_t interface) const {
    const std::lock_guard lock(mutex_);
    const auto bound = drivers_.find(interface);
    return bound == drivers_.end() ? "" : bound->second;
}

void UsbNode::unplug() {
    const std::lock_guard lock(mutex_);
    gone_ = true;
    for (auto& transfer : transfers_)
        if (!transfer->done)
            transfer->finish(ESHUTDOWN, 0);
}

bool UsbNode::isClaimed(std::uint8_t interface) const {
    const std::lock_guard lock(mutex_);
    return claims_.contains(interface);
}

int UsbNode::timesOpened() const {
    const std::lock_guard lock(mutex_);
    return timesOpened_;
}

int UsbNode::openAtPresent() const {
    const std::lock_guard lock(mutex_);
    return static_cast<int>(clients_.size());
}

void UsbNode::clientConnected(UMockdevIoctlBase*, Client client, void* self) {
    auto& node = *static_cast<UsbNode*>(self);
    const std::lock_guard lock(node.mutex_);
    ++node.timesOpened_;
    node.clients_.insert(client);
    // This version of umockdev declares a signal for a client that has gone, but does not send it.
    g_object_weak_ref(G_OBJECT(client), clientGone, self);
}

// As the kernel does, this releases what a dead process claimed but does not bring its printer driver back.
void UsbNode::clientGone(void* self, _GObject* object) {
    auto& node = *static_cast<UsbNode*>(self);
    const auto* client = reinterpret_cast<Client>(object);
    const std::lock_guard lock(node.mutex_);
    std::erase_if(node.clients_, [=](const auto& other) { return other == client; });
    std::erase_if(node.claims_, [=](const auto& claim) { return claim.second == client; });
    std::erase_if(node.transfers_, [=](const auto& transfer) { return transfer->client == client; });
}

int UsbNode::handleIoctl(UMockdevIoctlBase*, Client client, void* self) {
    auto& node = *static_cast<UsbNode*>(self);
    const std::lock_guard lock(node.mutex_);
    const auto request = umockdev_ioctl_client_get_request(client);
    auto* argument = umockdev_ioctl_client_get_arg(client);
    if (request == USBDEVFS_REAPURB || request == USBDEVFS_REAPURBNDELAY) {
        auto* pointer = umockdev_ioctl_data_resolve(argument, 0, sizeof(void*), nullptr);
        if (node.reap(client, pointer))
            umockdev_ioctl_client_complete(client, 0, 0);
        else
            tryAgainLater(client);
        return TRUE;
    }
    const int error = node.perform(client, request, argument);
    umockdev_ioctl_client_complete(client, error == 0 ? 0 : -1, error);
    return TRUE;
}

int UsbNode::perform(Client client, unsigned long request, UMockdevIoctlData* argument) {
    if (request == USBDEVFS_DISCARDURB)
        return discard(valueIn<gulong>(argument));
    const auto size = _IOC_SIZE(request);
    auto* data = size == 0 ? nullptr : umockdev_ioctl_data_resolve(argument, 0, size, nullptr);
    if (data == nullptr)
        return ENOTTY;
    if (gone_)
        return ENODEV;
    switch (request) {
        case USBDEVFS_GET_CAPABILITIES:
            valueIn<std::uint32_t>(data) = USBDEVFS_CAP_ZERO_PACKET | USBDEVFS_CAP_NO_PACKET_SIZE_LIM;
            return 0;
        case USBDEVFS_GETDRIVER: {
            auto& answer = valueIn<usbdevfs_getdriver>(data);
            const auto interface = static_cast<std::uint8_t>(answer.interface);
            const auto name = claims_.contains(interface) ? "usbfs" : drivers_[interface];
            name.copy(answer.driver, USBDEVFS_MAXDRIVERNAME);
            return name.empty() ? ENODATA : 0;
        }
        case USBDEVFS_CLAIMINTERFACE:
            return claim(client, static_cast<std::uint8_t>(valueIn<unsigned>(data)), false);
        case USBDEVFS_DISCONNECT_CLAIM:
            return claim(client,
                         static_cast<std::uint8_t>(valueIn<usbdevfs_disconnect_claim>(data).interface), true);
        case USBDEVFS_RELEASEINTERFACE:
            return release(client, static_cast<std::uint8_t>(valueIn<unsigned>(data)));
        case USBDEVFS_IOCTL: {
            const auto& inner = valueIn<usbdevfs_ioctl>(data);
            return driverRequest(static_cast<std::uint8_t>(inner.ifno),
                                 static_cast<unsigned>(inner.ioctl_code));
        }
        case USBDEVFS_SETINTERFACE: {
            const auto& choice = valueIn<usbdevfs_setinterface>(data);
            const auto interface = static_cast<std::uint8_t>(choice.interface);
            const auto alternate = static_cast<std::uint8_t>(choice.altsetting);
            if (const auto answer = printer_.control({0x01, 11, alternate, interface, 0}); answer.error != 0)
                return answer.error;
            if (onSetInterface)
                onSetInterface(interface, alternate);
            return 0;
        }
        case USBDEVFS_SUBMITURB:
            return submit(client, data);
        default:
            return ENOTTY;
    }
}

int UsbNode::claim(Client client, std::uint8_t interface, bool detach) {
    if (printer_.setting(interface, 0) == nullptr && printer_.setting(interface, 1) == nullptr)
        return ENOENT;
    if (const auto owner = claims_.find(interface); owner != claims_.end())
        return owner->second == client ? 0 : EBUSY;
    if (detach)
        drivers_[interface].clear();
    if (!drivers_[interface].empty())
        return EBUSY;
    claims_[interface] = client;
    return 0;
}

int UsbNode::release(Client client, std::uint8_t interface) {
    const auto owner = claims_.find(interface);
    if (owner == claims_.end() || owner->second != client)
        return EINVAL;
    claims_.erase(owner);
    return 0;
}

int UsbNode::driverRequest(std::uint8_t interface, unsigned request) {
    if (request == USBDEVFS_DISCONNECT) {
        if (drivers_[interface].empty())
            return ENODATA;
        drivers_[interface].clear();
        return 0;
    }
    if (request == USBDEVFS_CONNECT) {
        const auto* setting = printer_.setting(interface, printer_.currentSetting(interface));
        if (claims_.contains(interface) || setting == nullptr)
            return EBUSY;
        // The kernel's printer driver leaves IPP over USB alone.
        if (setting->interfaceClass == 7 && setting->subClass == 1 && setting->protocol != 4)
            drivers_[interface] = "usblp";
        return 0;
    }
    return ENOTTY;
}

// Requests to an interface or endpoint need the interface. GET_DEVICE_ID does not, when it names an existing
// setting of printer class; otherwise its low byte, the setting, is taken for the interface.
int UsbNode::refusal(Client client, const UsbSetup& setup) const {
    if (isGetDeviceID(setup)) {
        const auto* setting = printer_.setting(static_cast<std::uint8_t>(setup.wIndex >> 8U),
                                               static_cast<std::uint8_t>(setup.wIndex & 0xFFU));
        if (setting != nullptr && setting->interfaceClass == 7)
            return 0;
    }
    if ((setup.bmRequestType & kRecipientMask) != kToInterface &&
        (setup.bmRequestType & kRecipientMask) != kToEndpoint)
        return 0;
    const auto owner = claims_.find(static_cast<std::uint8_t>(setup.wIndex & 0xFFU));
    return owner != claims_.end() && owner->second == client ? 0 : EBUSY;
}

int UsbNode::submit(Client client, UMockdevIoctlData* urb) {
    auto transfer = std::make_unique<Transfer>(client, urb);
    auto& header = transfer->header();
    if (header.buffer_length > 0)
        transfer->buffer = umockdev_ioctl_data_resolve(urb, offsetof(usbdevfs_urb, buffer),
                                                       static_cast<gulong>(header.buffer_length), nullptr);
    const std::size_t length = static_cast<std::size_t>(header.buffer_length);
    if (header.type == USBDEVFS_URB_TYPE_CONTROL) {
        if (transfer->buffer == nullptr || length < kSetupLength)
            return EINVAL;
        const auto setup = UsbSetup::parse(transfer->buffer->data);
        if (const int error = refusal(client, setup); error != 0)
            return error;
        transfer->progress = UsbTransfer::control(printer_, setup, length - kSetupLength);
    } else if (std::ranges::none_of(claims_, [=](const auto& owned) { return owned.second == client; })) {
        return EBUSY;
    } else if ((header.endpoint & USB_DIR_IN) != 0) {
        transfer->progress = UsbTransfer::bulkIn(printer_, header.endpoint, length);
    } else {
        const auto* bytes =
            transfer->buffer == nullptr ? nullptr : reinterpret_cast<const char*>(transfer->buffer->data);
        transfer->progress = UsbTransfer::bulkOut(printer_, header.endpoint, {bytes, length});
    }
    // What the device has answered cannot be discarded any more.
    if (header.type == USBDEVFS_URB_TYPE_CONTROL || (header.endpoint & USB_DIR_IN) == 0)
        advance(*transfer);
    transfers_.push_back(std::move(transfer));
    return 0;
}

void UsbNode::advance(Transfer& transfer) {
    const auto outcome = transfer.progress->outcome();
    if (!outcome)
        return;
    const std::size_t offset = transfer.header().type == USBDEVFS_URB_TYPE_CONTROL ? kSetupLength : 0;
    if (transfer.buffer != nullptr)
        std::ranges::copy(outcome->data, transfer.buffer->data + offset);
    transfer.finish(outcome->error, outcome->length);
}

bool UsbNode::reap(Client client, UMockdevIoctlData* argument) {
    for (auto at = transfers_.begin(); at != transfers_.end(); ++at) {
        auto& transfer = **at;
        if (transfer.client != client)
            continue;
        if (!transfer.done)
            advance(transfer);
        if (!transfer.done)
            continue;
        umockdev_ioctl_data_set_ptr(argument, 0, transfer.urb);
        transfers_.erase(at);
        return true;
    }
    return false;
}

int UsbNode::discard(unsigned long address) {
    for (auto& transfer : transfers_)
        if (transfer->urb->client_addr == address) {
            if (!transfer->done)
                transfer->finish(ENOENT, 0);
            return 0;
        }
    return EINVAL;
}

}  // namespace ventras
