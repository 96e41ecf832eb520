#include "drivers/SoftwareUpdateDrivers.h"

#include <vector>

#include "deviceid/PMStringAdditions.h"
#include "drivers/PPDValues.h"
#include "platform/PrintToolAgentChannel.h"

namespace ventras::SoftwareUpdateDrivers {
namespace {

using Text = std::optional<std::string>;

std::optional<PropertyValue> valueIn(const PropertyDictionary& dictionary, std::string_view key) {
    const auto entry = dictionary.find(key);
    return entry == dictionary.end() ? std::nullopt : std::optional(entry->second);
}

/// "key:value"; absent when the value is.
Text component(std::string_view key, const Text& value) {
    return value ? Text(std::string(key) + ":" + *value) : std::nullopt;
}

/// Two components of a device ID; absent when one of them is.
Text components(const Text& first, const Text& second) {
    return first && second ? Text(*first + ";" + *second) : std::nullopt;
}

Text scanID(const Text& deviceID) {
    return deviceID ? PMStringAdditions::softwareUpdateScaneID(*deviceID) : std::nullopt;
}

/// The device IDs to ask about, in order. Only two of them are asked about as they are put together; the
/// catalogue knows the others in their normal form.
std::vector<Text> identitiesOf(const PPDValues& ppd) {
    const auto manufacturer = ppd.text("Manufacturer");
    const auto maker = component("MANUFACTURER", manufacturer);
    const auto model = component("MODEL", ppd.text("ModelName"));
    const auto nickName = component("MODEL", ppd.text("NickName"));
    const auto shortName = component("MODEL", ppd.text("ShortNickName"));

    std::vector<Text> identities{
        ppd.text("1284DeviceID"),
        scanID(components(maker, model)),
        components(maker, nickName),
        components(maker, shortName),
        scanID(model),
        scanID(shortName),
        scanID(nickName),
    };
    for (const auto& value : ppd.allBytes("product")) {
        const auto product = component("product", decoded(value, ppd.encoding()));
        identities.push_back(scanID(product));
        identities.push_back(scanID(components(component("MFG", manufacturer), product)));
    }
    return identities;
}

}  // namespace

std::optional<PPDRecord> forDevice(PrintToolAgentChannel& agent, const Text& deviceID, bool vellum) {
    if (!deviceID)
        return std::nullopt;
    const auto reply = agent.sendCommandSync(
        PrintToolAgentChannel::kService, PrintToolAgentChannel::kCountDriverPackages,
        {{PrintToolAgentKeys::kScanID, *deviceID}, {PrintToolAgentKeys::kVellum, vellum}});
    if (packageCount(reply) != 1)
        return std::nullopt;

    PPDRecord record;
    record.suDriverPredicate = *deviceID;
    record.suDriverConflicts = valueIn(reply.dictionary, PrintToolAgentKeys::kConflicts);
    record.suCacheCurrent = valueIn(reply.dictionary, PrintToolAgentKeys::kIsCacheCurrent);
    return record;
}

std::optional<PPDRecord> forPPD(PrintToolAgentChannel& agent, ppd_file_t* ppd) {
    for (const auto& identity : identitiesOf(PPDValues(ppd)))
        if (auto record = forDevice(agent, identity, true))
            return record;
    return std::nullopt;
}

}  // namespace ventras::SoftwareUpdateDrivers
