#include "deviceid/PMStringAdditions.h"

#include <glib.h>

#include <array>
#include <memory>

#include "deviceid/DeviceIdentity.h"
#include "deviceid/TextScan.h"
#include "platform/Utf8.h"

namespace ventras::PMStringAdditions {
namespace {

using namespace std::string_view_literals;
using DeviceIdentity::View;
using Keys = std::span<const std::string_view>;

// IEEE 1284 allows long and short spellings; DNS-SD prefixes them with "usb_".
constexpr std::array kCommandSetKeys{"CMD:"sv, "COMMAND SET:"sv, "usb_CMD:"sv, "usb_COMMAND SET:"sv,
                                     "pdl:"sv};
// Devices spell it "COMPATIBLITY".
constexpr std::array kCompatibleIDKeys{"CID:"sv, "COMPATIBLITY ID:"sv, "usb_CID:"sv,
                                       "usb_COMPATIBLITY ID:"sv};
constexpr std::array kMakeKeys{"MFR:"sv,  "MFG:"sv, "MANUFACTURER:"sv, "usb_MFG:"sv, "usb_MANUFACTURER:"sv,
                               "usb_G:"sv};
constexpr std::array kModelKeys{"MDL:"sv, "MODEL:"sv, "usb_MDL:"sv, "usb_MODEL:"sv};
constexpr std::array kTypeKeys{"ty:"sv};
constexpr std::array kSerialNumberKeys{"SN:"sv,     "SRN:"sv,     "SERN:"sv,
                                       "usb_SN:"sv, "usb_SRN:"sv, "usb_SERN:"sv};
constexpr std::array kProductKeys{"product:"sv};
constexpr std::array kScanKeys{"scan:"sv, "Scan:"sv, "scan"sv, "Scan"sv};
// Without the colon, which therefore stays in the name; it tells a description from a make and model.
constexpr std::array kDescriptionKeys{"DES"sv, "DESCRIPTION"sv};

/// Where the key stands in the component, if that place is the first and could have only white space before
/// it.
std::size_t findKey(std::string_view component, std::string_view key) {
    if (key.empty() || TextScan::trimmed(key).size() != key.size())
        return TextScan::findIgnoringCase(component, key);
    // Such a key cannot begin within the indent, so looking behind it is enough. Most lookups end here.
    const auto indent = component.find_first_not_of(" \t");
    if (indent == std::string_view::npos || !TextScan::startsWithIgnoringCase(component.substr(indent), key))
        return std::string_view::npos;
    return indent;
}

View valueForKey(std::string_view component, std::string_view key) {
    const auto found = findKey(component, key);
    if (found == std::string_view::npos)
        return std::nullopt;
    const auto upToKey = component.substr(0, found + key.size());
    if (found != 0 && TextScan::trimmed(upToKey).size() != key.size())
        return std::nullopt;
    return component.substr(upToKey.size());
}

View lookUp(std::string_view deviceID, Keys keys) {
    if (deviceID.empty())
        return std::nullopt;
    TextScan::Components components{deviceID, ";"};
    while (const auto component = components.next())
        for (const auto key : keys)
            if (const auto value = valueForKey(*component, key))
                return value;
    return std::nullopt;
}

View lookUpMake(std::string_view deviceID) {
    const auto make = lookUp(deviceID, kMakeKeys);
    return make ? make : DeviceIdentity::makeFromProduct(lookUp(deviceID, kProductKeys));
}

View lookUpModel(std::string_view deviceID) {
    for (const Keys keys : {Keys{kModelKeys}, Keys{kTypeKeys}})
        if (const auto model = lookUp(deviceID, keys))
            return model;
    return DeviceIdentity::modelFromProduct(lookUp(deviceID, kProductKeys));
}

void addComponent(DeviceDescription& dictionary, std::string_view component, std::string_view keySeparator) {
    const auto found = keySeparator.empty() ? std::string_view::npos : component.find(keySeparator);
    if (found != std::string_view::npos && characterCount(keySeparator) != 1)
        return;
    const auto key = TextScan::trimmedOfLineEnds(component.substr(0, found));
    const auto value = found == std::string_view::npos
                           ? ""sv
                           : TextScan::trimmedOfLineEnds(component.substr(found + keySeparator.size()));
    dictionary.insert_or_assign(TextScan::lowerCased(key), std::string(value));
}

constexpr bool staysInURL(char c) {
    const bool isLetter = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
    return isLetter || (c >= '0' && c <= '9') || "-._~!$'*"sv.find(c) != std::string_view::npos;
}

std::string percentEscaped(std::string_view bytes) {
    constexpr auto kDigits = "0123456789ABCDEF"sv;
    std::string escaped;
    escaped.reserve(bytes.size());
    for (const char c : bytes) {
        if (staysInURL(c)) {
            escaped += c;
            continue;
        }
        const auto byte = static_cast<unsigned char>(c);
        escaped.append({'%', kDigits[byte >> 4U], kDigits[byte & 0xFU]});
    }
    return escaped;
}

}  // namespace

std::optional<std::string> searchStringFor(std::string_view deviceID, Keys keys) {
    return std::optional<std::string>{lookUp(deviceID, keys)};
}

std::optional<std::string> stringForKey(std::string_view deviceID, std::string_view key) {
    return searchStringFor(deviceID, {&key, 1});
}

std::optional<std::string> commandSet(std::string_view deviceID) {
    return searchStringFor(deviceID, kCommandSetKeys);
}

std::optional<std::string> compatibleIDs(std::string_view deviceID) {
    return searchStringFor(deviceID, kCompatibleIDKeys);
}

std::optional<std::string> make(std::string_view deviceID) {
    return std::optional<std::string>{lookUpMake(deviceID)};
}

std::optional<std::string> model(std::string_view deviceID) {
    return std::optional<std::string>{lookUpModel(deviceID)};
}

std::optional<std::string> serialNumber(std::string_view deviceID) {
    return searchStringFor(deviceID, kSerialNumberKeys);
}

std::string product(std::string_view deviceID) {
    return DeviceIdentity::normalizedProduct(lookUp(deviceID, kProductKeys), lookUpMake(deviceID),
                                             lookUpModel(deviceID));
}

std::string deviceName(std::string_view deviceID) {
    if (auto name = DeviceIdentity::nameFrom(lookUpMake(deviceID), lookUpModel(deviceID)))
        return *std::move(name);
    return searchStringFor(deviceID, kDescriptionKeys).value_or("Unknown");
}

std::optional<std::string> softwareUpdateScaneID(std::string_view deviceID) {
    return DeviceIdentity::scanIDFrom(lookUpMake(deviceID), lookUpModel(deviceID));
}

std::optional<DeviceDescription> dictionaryValue(std::string_view deviceID) {
    return dictionaryValueForKeySeperator(deviceID, ":", ";");
}

std::optional<DeviceDescription> dictionaryValueForKeySeperator(std::string_view text,
                                                                std::string_view keySeparator,
                                                                std::string_view componentSeparator) {
    if (text.empty())
        return std::nullopt;
    DeviceDescription dictionary;
    TextScan::Components components{text, componentSeparator};
    while (const auto component = components.next())
        addComponent(dictionary, *component, keySeparator);
    return dictionary;
}

bool supportsPostscript(std::string_view deviceID) {
    return DeviceIdentity::listsPostscript(lookUp(deviceID, kCommandSetKeys));
}

bool supportsPCL(std::string_view deviceID) {
    return DeviceIdentity::listsPCL(lookUp(deviceID, kCommandSetKeys));
}

bool supportsScanning(std::string_view deviceID) {
    const auto answer = lookUp(deviceID, kScanKeys);
    return !answer || TextScan::equalsIgnoringCase(*answer, "T");
}

std::optional<std::string> pmStringByAddingPercentEscapesUsingEncoding(std::string_view text,
                                                                       const std::string& encoding) {
    if (TextScan::equalsIgnoringCase(encoding, "UTF-8"))
        return percentEscaped(text);
    const std::string source(text);
    gsize written = 0;
    const std::unique_ptr<char, decltype(&g_free)> converted{
        g_convert(source.data(), static_cast<gssize>(source.size()), encoding.c_str(), "UTF-8", nullptr,
                  &written, nullptr),
        &g_free};
    return converted ? std::optional{percentEscaped({converted.get(), written})} : std::nullopt;
}

}  // namespace ventras::PMStringAdditions
