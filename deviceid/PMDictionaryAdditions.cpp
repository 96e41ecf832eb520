#include "deviceid/PMDictionaryAdditions.h"

#include <array>
#include <span>
#include <string_view>

#include "deviceid/DeviceIdentity.h"
#include "deviceid/TextScan.h"

namespace ventras::PMDictionaryAdditions {
namespace {

using namespace std::string_view_literals;
using DeviceIdentity::View;

// The order differs from that for device-ID texts: a dictionary comes from a responder that knows the short
// keys.
constexpr std::array kCommandSetKeys{"CMD"sv, "COMMAND SET"sv, "usb_CMD"sv, "usb_COMMAND SET"sv, "pdl"sv};
// Devices spell it "COMPATIBLITY".
constexpr std::array kCompatibleIDKeys{"CID"sv, "COMPATIBLITY ID"sv, "usb_CID"sv, "usb_COMPATIBLITY ID"sv};
constexpr std::array kMakeKeys{"MFG"sv, "MANUFACTURER"sv, "MFR"sv, "usb_MFG"sv, "usb_MANUFACTURER"sv};
constexpr std::array kModelKeys{"MDL"sv, "MODEL"sv, "usb_MDL"sv, "usb_MODEL"sv};
constexpr std::array kSerialNumberKeys{"SN"sv, "SRN"sv, "SERN"sv, "usb_SN"sv, "usb_SRN"sv, "usb_SERN"sv};
constexpr std::array kProductKeys{"product"sv};
constexpr std::array kScanKeys{"scan"sv, "Scan"sv};

View lookUp(const DeviceDescription& description, std::span<const std::string_view> keys) {
    for (const auto key : keys)
        if (const auto entry = description.find(key); entry != description.end())
            return entry->second;
    return std::nullopt;
}

View lookUpMake(const DeviceDescription& description) {
    const auto make = lookUp(description, kMakeKeys);
    return make ? make : DeviceIdentity::makeFromProduct(lookUp(description, kProductKeys));
}

View lookUpModel(const DeviceDescription& description) {
    const auto model = lookUp(description, kModelKeys);
    return model ? model : DeviceIdentity::modelFromProduct(lookUp(description, kProductKeys));
}

}  // namespace

std::optional<std::string> commandSet(const DeviceDescription& description) {
    return std::optional<std::string>{lookUp(description, kCommandSetKeys)};
}

std::optional<std::string> compatibleIDs(const DeviceDescription& description) {
    return std::optional<std::string>{lookUp(description, kCompatibleIDKeys)};
}

std::optional<std::string> make(const DeviceDescription& description) {
    return std::optional<std::string>{lookUpMake(description)};
}

std::optional<std::string> model(const DeviceDescription& description) {
    return std::optional<std::string>{lookUpModel(description)};
}

std::optional<std::string> serialNumber(const DeviceDescription& description) {
    return std::optional<std::string>{lookUp(description, kSerialNumberKeys)};
}

std::string product(const DeviceDescription& description) {
    return DeviceIdentity::normalizedProduct(lookUp(description, kProductKeys), lookUpMake(description),
                                             lookUpModel(description));
}

std::optional<std::string> softwareUpdateScaneID(const DeviceDescription& description) {
    return DeviceIdentity::scanIDFrom(lookUpMake(description), lookUpModel(description));
}

bool supportsPostscript(const DeviceDescription& description) {
    return DeviceIdentity::listsPostscript(lookUp(description, kCommandSetKeys));
}

bool supportsPCL(const DeviceDescription& description) {
    return DeviceIdentity::listsPCL(lookUp(description, kCommandSetKeys));
}

// An absent key reads as a yes: only two noes are one.
bool supportsScanning(const DeviceDescription& description) {
    for (const auto& key : kScanKeys) {
        const auto answer = lookUp(description, {&key, 1});
        if (!answer || TextScan::equalsIgnoringCase(*answer, "T"))
            return true;
    }
    return false;
}

std::string stringValue(const DeviceDescription& description) {
    std::string text;
    for (const auto& [key, value] : description) {
        if (!text.empty())
            text += ';';
        text.append(key).append(":").append(value);
    }
    return text;
}

}  // namespace ventras::PMDictionaryAdditions
