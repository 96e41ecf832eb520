#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "deviceid/PMDictionaryAdditions.h"
#include "deviceid/PMStringAdditions.h"
#include "fuzz/Require.h"

// A device ID is whatever a plugged-in device answers. Every operation is run on it, as text and as the
// dictionary that it splits into, and the few things that hold for any bytes are checked.

namespace {

using ventras::require;

void readAsText(std::string_view deviceID) {
    using namespace ventras::PMStringAdditions;
    const bool isKnown = make(deviceID) && model(deviceID);
    require(softwareUpdateScaneID(deviceID).has_value() == isKnown);
    require(commandSet(deviceID) || (supportsPostscript(deviceID) && !supportsPCL(deviceID)));
    require(dictionaryValue(deviceID).has_value() == !deviceID.empty());
    require(product(deviceID).size() <= 2 * deviceID.size() + 3);
    require(deviceName(deviceID).size() <= deviceID.size() + 7);
    compatibleIDs(deviceID);
    serialNumber(deviceID);
    supportsScanning(deviceID);
    pmStringByAddingPercentEscapesUsingEncoding(deviceID, "ISO-8859-1");
}

void readAsDictionary(const ventras::DeviceDescription& description) {
    using namespace ventras::PMDictionaryAdditions;
    const bool isKnown = make(description) && model(description);
    require(softwareUpdateScaneID(description).has_value() == isKnown);
    require(commandSet(description) || (supportsPostscript(description) && !supportsPCL(description)));
    require(stringValue(description).empty() == description.empty());
    product(description);
    compatibleIDs(description);
    serialNumber(description);
    supportsScanning(description);
}

// Keys come lower-cased out of a text, and a dictionary's short keys are upper-case.
ventras::DeviceDescription underUpperCaseKeys(const ventras::DeviceDescription& description) {
    ventras::DeviceDescription upper;
    for (const auto& [key, value] : description) {
        std::string upperKey = key;
        for (char& c : upperKey)
            c = c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
        upper.insert_or_assign(upperKey, value);
    }
    return upper;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view deviceID{reinterpret_cast<const char*>(data), size};
    readAsText(deviceID);
    for (const auto keySeparator : {":", "=", "::"})
        if (const auto description =
                ventras::PMStringAdditions::dictionaryValueForKeySeperator(deviceID, keySeparator, ";")) {
            readAsDictionary(*description);
            readAsDictionary(underUpperCaseKeys(*description));
        }
    return 0;
}
