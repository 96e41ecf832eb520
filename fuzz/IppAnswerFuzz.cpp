#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include "devices/IPPAdditions.h"
#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDManager.h"
#include "drivers/PPDParser.h"
#include "fuzz/PPDChecks.h"
#include "fuzz/RecordChecks.h"
#include "fuzz/Require.h"
#include "platform/FileContent.h"
#include "platform/MessageLimits.h"
#include "platform/PropertyList.h"
#include "platform/Utf8.h"
#include "platform/linux/options/DriverlessPpd.h"
#include "platform/linux/options/PrinterCapabilities.h"
#include "platform/linux/scheduler/NewQueue.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/ScriptedReply.h"

// A printer's answer to Get-Printer-Attributes, byte for byte as it comes out of the connection. It goes the
// whole way: dictionary, description of the printer, settings of its queue, and the PPD that is made for this
// very printer, read again as any other driver.

namespace {

using namespace ventras;

PropertyDictionary dictionaryFrom(ipp_t* answer) {
    FakeLog log;
    PropertyDictionary dictionary;
    for (auto* attribute = ippFirstAttribute(answer); attribute != nullptr;
         attribute = ippNextAttribute(answer)) {
        const char* name = ippGetName(attribute);
        const std::string key = name == nullptr ? "" : name;
        IPPAdditions::ippAddStringsFromAttribute(dictionary, attribute, key);
        IPPAdditions::ippAddProductFromAttribute(dictionary, attribute, key + "()");
        IPPAdditions::ippAddUUIDStringFromAttribute(dictionary, attribute, key + "-uuid");
        IPPAdditions::ippAddURIStringFromAttribute(dictionary, attribute, "printer.local", 631, key + "-uri",
                                                   log);
        IPPAdditions::ippAddStringArrayFromAttribute(dictionary, attribute, key + "[]");
        if (ippGetValueTag(attribute) == IPP_TAG_BEGIN_COLLECTION)
            IPPAdditions::ippAddPaperMaxFromAttribute(dictionary, attribute);
        if (ippGetValueTag(attribute) == IPP_TAG_BOOLEAN)
            IPPAdditions::ippAddBooleanFromAttribte(dictionary, attribute, key + "?");
    }
    return dictionary;
}

// The texts by which a printer is known, under the keys that its description has for them.
DeviceDescription descriptionFrom(const PropertyDictionary& dictionary) {
    constexpr std::pair<const char*, const char*> kKeys[] = {
        {"printer-dns-sd-name", "display-name"},
        {"printer-location", "note"},
        {"printer-make-and-model()", "product"},
        {"document-format-supported", "pdl"},
        {"urf-supported", "URF"},
        {"printer-uuid-uuid", "UUID"},
    };
    DeviceDescription description;
    for (const auto& [from, to] : kKeys)
        if (const auto* text = findText(dictionary, from))
            description.emplace(to, *text);
    return description;
}

// What the print system makes of the settings: a clean queue, or a refusal.
void checkQueue(const QueueAttributes& settings, const std::string& name) {
    const auto serialized = xmlPropertyList(settings);
    if (!serialized)
        return;
    const auto queue = NewQueue::parse("queue", *serialized, {{"PC WSItem User Name", name}});
    if (const auto* clean = std::get_if<NewQueue>(&queue))
        for (const auto& text : {clean->deviceURI, clean->location, clean->displayName})
            require(isValidUtf8(text) && !hasControlCharacters(text));
}

void checkDescription(const PropertyDictionary& dictionary, FakePlatform& fake, PPDManager& drivers) {
    VellumProfilePrinterObject printer(fake.platform, drivers, "ipp://printer.local/ipp/print");
    printer.setAttributes(descriptionFrom(dictionary));
    const auto settings = printer.driverInfo({.name = "generic"});
    require(settings.has_value() == printer.name().has_value());
    require(isValidUtf8(printer.description()));
    if (settings) {
        require(*findText(*settings, QueueAttributeKeys::kPrinterURI) == printer.deviceURI());
        checkQueue(*settings, *printer.name());
    }
}

void checkPPD(ipp_t* answer, PrinterService service) {
    const auto capabilities = printerCapabilities(answer, service);
    const auto made = driverlessPPD(capabilities.get(), service);
    const auto* file = std::get_if<TemporaryFile>(&made);
    if (file == nullptr) {
        require(!std::get<std::string>(made).empty());
        return;
    }
    const auto text = fileContent(file->path()).value_or("");
    checkPPDText(text);
    checkStockFilters(text);
    const auto record = parsePPDFile(file->path());
    require(record.has_value());
    checkRecord(*record);
    require(PPDManager::isFaxPPD(*record) == (service == PrinterService::FaxOut));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static FakePlatform fake;
    static PPDManager drivers(fake.platform);
    const bool isRefused = !MessageLimits().follow({data, size});
    const auto answer = isRefused ? nullptr : decodeIpp({reinterpret_cast<const char*>(data), size});
    if (!answer)
        return 0;
    checkDescription(dictionaryFrom(answer.get()), fake, drivers);
    checkPPD(answer.get(), PrinterService::Print);
    checkPPD(answer.get(), PrinterService::FaxOut);
    return 0;
}
