#include "tests/parts/FakePrinter.h"

#include <glib.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>
#include <set>
#include <utility>

#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

// The endpoints of interface 0; each interface has its own, which all its settings share.
constexpr std::uint8_t kBulkOut = 0x01;
constexpr std::uint8_t kBulkIn = 0x82;

constexpr std::uint8_t kIppOverUsb = 4;

constexpr std::uint8_t bulkOutOf(std::uint8_t interface) {
    return static_cast<std::uint8_t>(kBulkOut + 2 * interface);
}

constexpr std::uint8_t bulkInOf(std::uint8_t interface) {
    return static_cast<std::uint8_t>(kBulkIn + 2 * interface);
}

std::uint8_t low(std::size_t value) {
    return static_cast<std::uint8_t>(value & 0xFFU);
}

std::uint8_t high(std::size_t value) {
    return static_cast<std::uint8_t>(value >> 8U & 0xFFU);
}

void append(UsbBytes& bytes, std::initializer_list<std::uint8_t> more) {
    bytes.insert(bytes.end(), more);
}

bool isPrinter(const FakeUsbSetting& setting) {
    return setting.interfaceClass == 7 && setting.subClass == 1;
}

}  // namespace

UsbSetup UsbSetup::parse(const std::uint8_t* packet) {
    const auto word = [&](std::size_t at) {
        return static_cast<std::uint16_t>(packet[at] | packet[at + 1] << 8U);
    };
    return {packet[0], packet[1], word(2), word(4), word(6)};
}

UsbAnswer UsbAnswer::stall() {
    return {EPIPE, {}, {}};
}

UsbAnswer UsbAnswer::silence() {
    return {ETIMEDOUT, {}, {}};
}

UsbAnswer UsbAnswer::text(std::string_view bytes) {
    return {0, {bytes.begin(), bytes.end()}, {}};
}

UsbAnswer UsbAnswer::deviceID(std::uint16_t length, std::string_view text) {
    UsbAnswer answer{0, {high(length), low(length)}, {}};
    answer.data.insert(answer.data.end(), text.begin(), text.end());
    return answer;
}

bool isGetDeviceID(const UsbSetup& setup) {
    return setup.bmRequestType == 0xA1 && setup.bRequest == 0;
}

bool isGetDeviceDescriptor(const UsbSetup& setup) {
    return setup.bmRequestType == 0x80 && setup.bRequest == 6 && setup.wValue == 0x0100;
}

bool isGetString(const UsbSetup& setup, std::uint8_t index) {
    return setup.bmRequestType == 0x80 && setup.bRequest == 6 && setup.wValue == 0x0300 + index;
}

UsbBytes FakePrinter::deviceDescriptor() const {
    const auto index = [](const std::string& text, std::uint8_t number) {
        return text.empty() ? std::uint8_t{0} : number;
    };
    return {18,
            1,
            0,
            2,
            0,
            0,
            0,
            64,
            low(model_.vendor),
            high(model_.vendor),
            low(model_.product),
            high(model_.product),
            0,
            1,
            index(model_.manufacturer, 1),
            index(model_.productName, 2),
            index(model_.serialNumber, 3),
            1};
}

UsbBytes FakePrinter::configurationDescriptor() const {
    UsbBytes bytes(9);
    std::set<std::uint8_t> interfaces;
    for (const auto& setting : model_.settings) {
        interfaces.insert(setting.interface);
        const std::uint8_t endpoints = isPrinter(setting) ? 2 : 0;
        append(bytes, {9, 4, setting.interface, setting.alternate, endpoints, setting.interfaceClass,
                       setting.subClass, setting.protocol, 0});
        if (endpoints != 0)
            append(bytes, {7, 5, bulkOutOf(setting.interface), 2, 0, 2, 0, 7, 5, bulkInOf(setting.interface),
                           2, 0, 2, 0});
    }
    const std::array<std::uint8_t, 9> header{9,
                                             2,
                                             low(bytes.size()),
                                             high(bytes.size()),
                                             low(interfaces.size()),
                                             std::max<std::uint8_t>(model_.configuration, 1),
                                             0,
                                             0xC0,
                                             1};
    std::ranges::copy(header, bytes.begin());
    return bytes;
}

UsbBytes FakePrinter::stringDescriptor(std::uint8_t index) const {
    if (index == 0)
        return {4, 3, 0x09, 0x04};
    const std::array texts{&model_.manufacturer, &model_.productName, &model_.serialNumber};
    const std::string& text = *texts.at(index - 1U);
    glong units = 0;
    const std::unique_ptr<gunichar2, decltype(&g_free)> utf16{
        g_utf8_to_utf16(text.data(), static_cast<glong>(text.size()), nullptr, &units, nullptr), g_free};
    UsbBytes bytes{low(2 + 2 * static_cast<std::size_t>(units)), 3};
    for (glong i = 0; i < units; ++i)
        append(bytes, {low(utf16.get()[i]), high(utf16.get()[i])});
    return bytes;
}

UsbAnswer FakePrinter::descriptor(const UsbSetup& setup) const {
    const auto index = static_cast<std::uint8_t>(setup.wValue & 0xFFU);
    switch (setup.wValue >> 8U) {
        case 1:
            return {0, deviceDescriptor(), {}};
        case 2:
            return {0, configurationDescriptor(), {}};
        case 3:
            // A device without strings has no list of languages either.
            if (index > 3 || model_.manufacturer + model_.productName + model_.serialNumber == "")
                return UsbAnswer::stall();
            return {0, stringDescriptor(index), {}};
        default:
            return UsbAnswer::stall();
    }
}

UsbAnswer FakePrinter::answer(const UsbSetup& setup) {
    const auto interface = static_cast<std::uint8_t>(setup.wIndex & 0xFFU);
    switch (setup.bmRequestType << 8U | setup.bRequest) {
        case 0x8006:
            return descriptor(setup);
        case 0x8008:  // GET_CONFIGURATION
            return {0, {model_.configuration}, {}};
        case 0x810A:  // GET_INTERFACE
            return {0, {settingInUse(interface)}, {}};
        case 0x0009:  // SET_CONFIGURATION
            currentSettings_.clear();
            return {};
        case 0x010B:  // SET_INTERFACE
            if (setting(interface, static_cast<std::uint8_t>(setup.wValue)) == nullptr)
                return UsbAnswer::stall();
            currentSettings_[interface] = static_cast<std::uint8_t>(setup.wValue);
            return {};
        case 0xA100: {  // GET_DEVICE_ID
            const auto number = high(setup.wIndex);
            const auto own = model_.deviceIDs.find(number);
            const auto& id = own == model_.deviceIDs.end() ? model_.deviceID : own->second;
            return UsbAnswer::deviceID(static_cast<std::uint16_t>(id.size() + 2), id);
        }
        case 0xA101:  // GET_PORT_STATUS: selected, no error
            return {0, {0x18}, {}};
        case 0x2102:  // SOFT_RESET
            toSend_.clear();
            return {};
        default:
            return UsbAnswer::stall();
    }
}

UsbAnswer FakePrinter::control(const UsbSetup& setup) {
    const std::lock_guard lock(mutex_);
    requests_.push_back(setup);
    if (auto faulty = fault(setup))
        return std::move(*faulty);
    auto reply = answer(setup);
    if (reply.data.size() > setup.wLength)
        reply.data.resize(setup.wLength);
    return reply;
}

const FakeUsbSetting* FakePrinter::settingAt(std::uint8_t endpoint) const {
    for (const auto& candidate : model_.settings)
        if (isPrinter(candidate) && candidate.alternate == settingInUse(candidate.interface) &&
            (endpoint == bulkOutOf(candidate.interface) || endpoint == bulkInOf(candidate.interface)))
            return &candidate;
    return nullptr;
}

std::string FakePrinter::reaction(const FakeUsbSetting& at, std::string_view data) {
    return at.protocol == kIppOverUsb ? http(at.interface, data) : interpreter(data);
}

UsbAnswer FakePrinter::bulkOut(std::uint8_t endpoint, std::string_view data) {
    const std::lock_guard lock(mutex_);
    if (auto faulty = bulkFault(endpoint))
        return std::move(*faulty);
    const auto* at = settingAt(endpoint);
    if (at == nullptr)
        return UsbAnswer::stall();
    received_ += data;
    toSend_[at->interface] += reaction(*at, data);
    return {};
}

std::optional<UsbAnswer> FakePrinter::bulkIn(std::uint8_t endpoint, std::size_t most) {
    const std::lock_guard lock(mutex_);
    if (auto faulty = bulkFault(endpoint))
        return faulty;
    const auto* at = settingAt(endpoint);
    if (at == nullptr)
        return UsbAnswer::stall();
    auto& toSend = toSend_[at->interface];
    if (toSend.empty())
        toSend += reaction(*at, {});
    if (toSend.empty())
        return std::nullopt;
    auto sent = UsbAnswer::text(std::string_view(toSend).substr(0, most));
    toSend.erase(0, sent.data.size());
    return sent;
}

std::uint8_t FakePrinter::currentSetting(std::uint8_t interface) const {
    const std::lock_guard lock(mutex_);
    return settingInUse(interface);
}

std::uint8_t FakePrinter::settingInUse(std::uint8_t interface) const {
    const auto current = currentSettings_.find(interface);
    return current == currentSettings_.end() ? std::uint8_t{0} : current->second;
}

const FakeUsbSetting* FakePrinter::setting(std::uint8_t interface, std::uint8_t alternate) const {
    for (const auto& candidate : model_.settings)
        if (candidate.interface == interface && candidate.alternate == alternate)
            return &candidate;
    return nullptr;
}

std::vector<UsbSetup> FakePrinter::requests() const {
    const std::lock_guard lock(mutex_);
    return requests_;
}

std::string FakePrinter::received() const {
    const std::lock_guard lock(mutex_);
    return received_;
}

bool FakePrinter::receives(std::string_view text, std::chrono::milliseconds limit) const {
    return comesTrue([&] { return received().find(text) != std::string::npos; }, limit);
}

}  // namespace ventras
