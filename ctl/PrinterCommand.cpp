#include "ctl/PrinterCommand.h"

#include "ctl/Complaint.h"
#include "ctl/Evidence.h"
#include "ctl/Output.h"
#include "ctl/Records.h"
#include "ctl/Services.h"
#include "ctl/Translation.h"
#include "deviceid/TextScan.h"
#include "devices/IPPUSBObject.h"
#include "devices/VellumProfilePrinterObject.h"

namespace ventras {
namespace {

/// What a queue with the driver that the device would get is told of the device.
Value infoWithGenericDriver(VentrasPrinterObject& device) {
    const auto drivers = device.driverList();
    if (!drivers || drivers->empty())
        return {};
    const auto info = device.driverInfo(drivers->front());
    return info ? Value{objectOf(*info)} : Value{};
}

Value mimeTypes(const DeviceDescription& description) {
    const auto joined = description.find("pdl");
    if (joined == description.end())
        return {};
    Array types;
    TextScan::Components components{joined->second, ","};
    while (const auto type = components.next())
        types.emplace_back(TextScan::lowerCased(*type));
    return types;
}

Value textUnder(const DeviceDescription& description, std::string_view key) {
    const auto found = description.find(key);
    return found == description.end() ? Value{} : Value{found->second};
}

}  // namespace

Exit showPrinter(const Arguments& arguments, Output& output) {
    if (arguments.operands.size() != 1)
        return usageError(translated("printer: which URI?"));
    const auto& uri = arguments.operands.front();
    if (!uri.starts_with("ipp://") && !uri.starts_with("ipps://"))
        return usageError(translated("printer: '%@' begins neither with ipp:// nor with ipps://", uri));
    Services services;
    VellumProfilePrinterObject printer(services.platform(), services.drivers(), uri);
    output.print(Object{{"attributes", objectOf(printer.attributes())},
                        {"name", printer.name()},
                        {"urf", printer.urf()},
                        {"pdl", printer.pdl()},
                        {"driverInfo", infoWithGenericDriver(printer)}});
    if (!printer.attributes().empty())
        return Exit::Success;
    complain(uri + ": " + printer.difficulty().value_or(translated("it says nothing of itself")));
    return Exit::Unreachable;
}

Exit showService(const Arguments& arguments, Output& output) {
    if (arguments.operands.size() != 1)
        return usageError(translated("service: which name?"));
    Services services;
    IPPUSBObject printer(services.drivers(), arguments.operands.front());
    const bool isFound = printer.txtDictionary().has_value();
    if (!isFound)
        printer.setTxtDictionary(
            DeviceDescription{});  // each further question would wait for an answer again
    const auto& description = *printer.txtDictionary();
    output.print(Object{{"attributes", objectOf(description)},
                        {"name", printer.name()},
                        {"urf", textUnder(description, "URF")},
                        {"pdl", mimeTypes(description)},
                        {"driverInfo", isFound ? infoWithGenericDriver(printer) : Value{}}});
    if (isFound)
        return Exit::Success;
    complain(translated("%@: no such service, or nobody answers for it", arguments.operands.front()));
    return Exit::NotFound;
}

}  // namespace ventras
