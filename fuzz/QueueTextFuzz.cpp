#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "devices/IPPUSBObject.h"
#include "devices/TXTRecord.h"
#include "drivers/PPDManager.h"
#include "fuzz/Require.h"
#include "platform/PropertyList.h"
#include "platform/ServiceRecord.h"
#include "platform/Utf8.h"
#include "platform/linux/Syslog.h"
#include "platform/linux/options/CapabilityText.h"
#include "platform/linux/options/PrinterAddress.h"
#include "platform/linux/scheduler/NewQueue.h"
#include "platform/linux/scheduler/QueueName.h"
#include "queues/QueueNaming.h"
#include "tests/fakes/FakePlatform.h"

// What a device, a service in DNS-SD or a user calls a printer becomes a queue's name, its URI, its text for
// people, a line in the log and a part of requests.

namespace {

using namespace ventras;

bool isClean(const std::string& text) {
    return isValidUtf8(text) && !hasControlCharacters(text);
}

void checkQueueName(const std::string& text) {
    const auto name = queueNameFrom(text);
    require(name.empty() == text.empty() && name.size() <= kLongestQueueText);
    if (name.empty())
        return;
    require(isClean(name) && isQueueName(name) && name.find_first_of(" /#") == name.npos);
    const auto other = uniqueQueueName(name, {name});
    require(other != name && isQueueName(other) && queueNameFrom(other) == other);
    const auto uri = queueURI(name);
    require(uri.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._~%:/") ==
            uri.npos);
}

void checkTexts(const std::string& text) {
    require(isClean(harmlessLine(text)));
    require(!isHarmlessName(text) || text.find_first_of("\"/:*%()<>[]{}\\^|\n\r") == text.npos);
    const auto model = harmlessModel(text);
    require(model.empty() || isHarmlessName(model));
    if (isValidUtf8(text))
        require(text.find(stripBracketedTag(text)) != text.npos);
}

void checkQueue(const std::string& uri, const std::string& name) {
    const auto settings = xmlPropertyList(QueueAttributes{
        {std::string(QueueAttributeKeys::kPrinterURI), uri},
        {std::string(QueueAttributeKeys::kLocation), name},
    });
    if (!settings)
        return;
    const auto parsed = NewQueue::parse(queueNameFrom(name), *settings, {{"PC WSItem User Name", name}});
    if (const auto* queue = std::get_if<NewQueue>(&parsed)) {
        require(isClean(queue->deviceURI) && isClean(queue->location) && isClean(queue->displayName));
        require(queue->deviceURI == uri);
    }
}

void checkService(const std::string& name, PPDManager& drivers) {
    const auto fullName = ippServiceFullName(name);
    require(!fullName || (!name.empty() && name.size() <= 63 && fullName->ends_with("._ipp._tcp.local")));
    IPPUSBObject printer(drivers, name);
    printer.setTxtDictionary(dictionaryFromTXTRecord(name));
    if (isValidUtf8(name))
        checkQueue(printer.deviceURI().value_or(""), printer.name().value_or(""));
    printer.uris();
    printer.supportsFax();
}

// Names of services are not looked up here: that takes seconds.
void checkAddress(const std::string& text) {
    for (const auto* scheme : {"ipp://", "ipps://"})
        for (const auto service : {PrinterService::Print, PrinterService::FaxOut})
            if (const auto address = PrinterAddress::find(scheme + text, service))
                require(!address->host.empty() && address->port > 0 && address->port <= 65535);
    checkQueue("ipp://" + text, text);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static FakePlatform fake;
    static PPDManager drivers(fake.platform);
    const std::string text{reinterpret_cast<const char*>(data), size};
    checkQueueName(text);
    checkTexts(text);
    const std::string argument = text.c_str();  // these come from the command line, which ends at a NUL
    checkService(argument, drivers);
    checkAddress(argument);
    return 0;
}
