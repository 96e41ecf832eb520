#include "backend/usb/StockListing.h"

#include <algorithm>

#include "backend/usb/StockDeviceURI.h"
#include "deviceid/PMStringAdditions.h"

namespace ventras {
namespace {

constexpr std::string_view kSerialQuery = "?serial=";

/// Takes the next word off a line; one in quotation marks may hold blanks, and either kind of mark behind a
/// backslash.
std::string takeWord(std::string_view& line) {
    line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
    const bool isQuoted = line.starts_with('"');
    std::string word;
    std::size_t at = isQuoted ? 1 : 0;
    for (; at < line.size() && line[at] != (isQuoted ? '"' : ' '); ++at) {
        if (isQuoted && line[at] == '\\' && at + 1 < line.size())
            ++at;
        word += line[at];
    }
    line.remove_prefix(std::min(at + 1, line.size()));
    return word;
}

ListedDevice deviceOf(std::string_view line) {
    takeWord(line);  // class
    ListedDevice device{takeWord(line), {}};
    takeWord(line);  // make and model
    takeWord(line);  // what people are shown
    device.deviceID = takeWord(line);
    return device;
}

std::string_view withoutQuery(std::string_view uri) {
    return uri.substr(0, uri.find('?'));
}

/// Whether the URI is the listed one, perhaps but for the number of the interface.
bool isListedAs(std::string_view uri, const ListedDevice& device) {
    return device.uri.starts_with(uri) && (device.uri.size() == uri.size() || device.uri[uri.size()] == '&');
}

bool hasSerialNumberOf(std::string_view uri, const ListedDevice& device) {
    const auto bare = withoutQuery(uri);
    const auto serialNumber = PMStringAdditions::serialNumber(device.deviceID);
    return serialNumber && device.uri != bare && withoutQuery(device.uri) == bare &&
           percentDecoded(uri.substr(bare.size())) == std::string(kSerialQuery) + *serialNumber;
}

}  // namespace

std::vector<ListedDevice> listedDevices(std::string_view listing) {
    std::vector<ListedDevice> devices;
    while (!listing.empty()) {
        const auto end = std::min(listing.find('\n'), listing.size());
        if (auto device = deviceOf(listing.substr(0, end)); device.uri.find("://") != std::string::npos)
            devices.push_back(std::move(device));
        listing.remove_prefix(std::min(end + 1, listing.size()));
    }
    return devices;
}

std::optional<std::string> listedURI(std::string_view uri, const std::vector<ListedDevice>& devices) {
    for (const auto isTheOne : {isListedAs, hasSerialNumberOf}) {
        const auto found =
            std::ranges::find_if(devices, [&](const auto& device) { return isTheOne(uri, device); });
        if (found != devices.end())
            return found->uri;
    }
    // Without a serial number on the bus the stock backend takes any of the make and model.
    const auto bare = std::ranges::find(devices, withoutQuery(uri), &ListedDevice::uri);
    return bare == devices.end() ? std::nullopt : std::optional(std::string(uri));
}

}  // namespace ventras
