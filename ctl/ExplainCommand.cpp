#include "ctl/ExplainCommand.h"

#include <set>

#include "agent/CommandLine.h"
#include "ctl/Complaint.h"
#include "ctl/Explanation.h"
#include "ctl/Output.h"
#include "ctl/SchedulerCheck.h"
#include "ctl/Services.h"
#include "ctl/Translation.h"
#include "devices/IPPUSBObject.h"
#include "devices/ScannerObject.h"
#include "devices/UsbEnumeration.h"
#include "devices/VellumProfilePrinterObject.h"

namespace ventras {
namespace {

/// What one argument of the agent stands for: devices, or a remark why there are none.
struct Meaning {
    std::vector<DevicePtr> devices;
    const char* remark = nullptr;
};

class ArgumentReader {
public:
    explicit ArgumentReader(Services& services) : services_(services) {}

    Meaning read(const std::string& argument) {
        const auto [kind, text] = parseArgument(argument);
        switch (kind) {
            case ArgumentKind::Deprecated:
                return {{}, "an option of old, without effect"};
            case ArgumentKind::UsbLocation:
                return usbPrinters(std::string(text));
            case ArgumentKind::Scanner:
                return scanner(text);
            case ArgumentKind::NoDownload:
                return {{}, "missing drivers would not be downloaded"};
            case ArgumentKind::Skerrow:
                return {{}, "missing drivers would be announced, not offered"};
            case ArgumentKind::IppUsb:
                return ippUsbPrinter(std::string(text));
            case ArgumentKind::NetworkURI:
                return networkPrinter(argument);
            case ArgumentKind::Ignored:
                break;
        }
        return {{}, "not an argument that the agent knows; ignored"};
    }

private:
    UsbEnumeration usb() { return {services_.platform(), services_.drivers(), services_.platform().usb}; }

    Meaning usbPrinters(const std::string& place) {
        const auto found = usb().printerObjects({place});
        return {{found.begin(), found.end()}, "no USB printer at this place that tells what it is"};
    }

    Meaning scanner(std::string_view description) {
        auto enumeration = usb();
        if (auto found = ScannerObject::scannerObjectWithString(description, enumeration,
                                                                services_.platform().computerName))
            return {{std::move(found)}};
        return {{}, "not the description of a scanner"};
    }

    // A printer that nobody knows is asked for once; each further question would wait for an answer again.
    Meaning ippUsbPrinter(std::string registeredName) {
        auto printer =
            IPPUSBObject::ippUSBObjectWithRegisteredName(services_.drivers(), std::move(registeredName));
        if (!printer->txtDictionary())
            printer->setTxtDictionary(DeviceDescription{});
        return {{std::move(printer)}};
    }

    Meaning networkPrinter(const std::string& uri) {
        if (!uris_.insert(uri).second)
            return {{}, "given before"};
        return {{VellumProfilePrinterObject::initVellumProfilePrinterObjectWithURI(
            services_.platform(), services_.drivers(), uri)}};
    }

    Services& services_;
    std::set<std::string> uris_;
};

Object withArgument(const std::string& argument, Object object) {
    object.insert(object.begin(), {"argument", argument});
    return object;
}

}  // namespace

Exit explainArguments(const Arguments& arguments, Output& output) {
    if (arguments.operands.empty())
        return usageError(translated("explain: which arguments?"));
    Services services;
    const auto unreachable = schedulerIsUnreachable();
    ArgumentReader reader(services);
    Array explanations;
    bool hasDevice = false;
    for (const auto& argument : arguments.operands) {
        const auto [devices, remark] = reader.read(argument);
        hasDevice |= !devices.empty();
        if (devices.empty())
            explanations.emplace_back(withArgument(argument, {{"device", Value{}}, {"outcome", remark}}));
        for (const auto& device : devices)
            explanations.emplace_back(withArgument(argument, explain(*device, services)));
    }
    if (output.isForProgram())
        output.printJson(explanations);
    else
        for (const auto& explanation : explanations)
            output.print(shortened(std::get<Object>(explanation)));
    if (unreachable)
        return *unreachable;
    return hasDevice ? Exit::Success : Exit::NotFound;
}

}  // namespace ventras
