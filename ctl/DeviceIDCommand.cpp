#include "ctl/DeviceIDCommand.h"

#include "ctl/Complaint.h"
#include "ctl/Json.h"
#include "ctl/LineByLine.h"
#include "ctl/Output.h"
#include "ctl/Translation.h"
#include "deviceid/PMDictionaryAdditions.h"
#include "deviceid/PMStringAdditions.h"

namespace ventras {
namespace {

namespace OfText = PMStringAdditions;
namespace OfDictionary = PMDictionaryAdditions;

Value valueOf(const std::optional<DeviceDescription>& description) {
    return description ? Value{Object(description->begin(), description->end())} : Value{};
}

Object answersFor(std::string_view deviceID) {
    return Object{
        {"make", OfText::make(deviceID)},
        {"model", OfText::model(deviceID)},
        {"serialNumber", OfText::serialNumber(deviceID)},
        {"commandSet", OfText::commandSet(deviceID)},
        {"compatibleIDs", OfText::compatibleIDs(deviceID)},
        {"product", OfText::product(deviceID)},
        {"deviceName", OfText::deviceName(deviceID)},
        {"softwareUpdateScaneID", OfText::softwareUpdateScaneID(deviceID)},
        {"supportsPostscript", OfText::supportsPostscript(deviceID)},
        {"supportsPCL", OfText::supportsPCL(deviceID)},
        {"supportsScanning", OfText::supportsScanning(deviceID)},
        {"dictionaryValue", valueOf(OfText::dictionaryValue(deviceID))},
    };
}

Object answersFor(const DeviceDescription& description) {
    return Object{
        {"make", OfDictionary::make(description)},
        {"model", OfDictionary::model(description)},
        {"serialNumber", OfDictionary::serialNumber(description)},
        {"commandSet", OfDictionary::commandSet(description)},
        {"compatibleIDs", OfDictionary::compatibleIDs(description)},
        {"product", OfDictionary::product(description)},
        {"softwareUpdateScaneID", OfDictionary::softwareUpdateScaneID(description)},
        {"supportsPostscript", OfDictionary::supportsPostscript(description)},
        {"supportsPCL", OfDictionary::supportsPCL(description)},
        {"supportsScanning", OfDictionary::supportsScanning(description)},
        {"stringValue", OfDictionary::stringValue(description)},
    };
}

/// The dictionary of one line: an object of texts, where null is as good as no member.
std::optional<DeviceDescription> descriptionFromJson(const std::string& line) {
    const auto value = parseJson(line);
    const auto* object = value ? std::get_if<Object>(&*value) : nullptr;
    if (object == nullptr)
        return std::nullopt;
    DeviceDescription description;
    for (const auto& [key, member] : *object) {
        if (member.isNull())
            continue;
        const auto* text = std::get_if<std::string>(&member);
        if (text == nullptr)
            return std::nullopt;
        description.insert_or_assign(key, *text);
    }
    return description;
}

}  // namespace

Exit showDeviceIDs(const Arguments& arguments, Output& output) {
    if (arguments.areFromStandardInput())
        return answerLines(output,
                           [](const std::string& line) { return std::optional<Value>{answersFor(line)}; });
    if (arguments.operands.empty())
        return usageError(translated("device-id: which device ID?"));
    for (const auto& deviceID : arguments.operands)
        output.print(answersFor(deviceID));
    return Exit::Success;
}

Exit showDescription(const Arguments& arguments, Output& output) {
    if (arguments.areFromStandardInput())
        return answerLines(output, [](const std::string& line) {
            const auto description = descriptionFromJson(line);
            return description ? std::optional<Value>{answersFor(*description)} : std::nullopt;
        });
    DeviceDescription description;
    for (const auto& pair : arguments.operands) {
        const auto equals = pair.find('=');
        if (equals == std::string::npos)
            return usageError(translated("txt: '%@' is no KEY=VALUE", pair));
        description.insert_or_assign(pair.substr(0, equals), pair.substr(equals + 1));
    }
    output.print(answersFor(description));
    return Exit::Success;
}

}  // namespace ventras
