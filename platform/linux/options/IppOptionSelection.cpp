#include "platform/linux/options/IppOptionSelection.h"

#include <array>
#include <variant>

#include "platform/IppConnection.h"
#include "platform/Log.h"
#include "platform/linux/options/DriverlessPpd.h"
#include "platform/linux/options/PrinterAddress.h"
#include "platform/linux/options/PrinterCapabilities.h"

namespace ventras {
namespace {

PrinterService serviceFor(const std::string& ppdPath) {
    return ppdPath.ends_with(AutoSelectContext::kFaxPPDEnding) ? PrinterService::FaxOut
                                                               : PrinterService::Print;
}

IppAnswer askForDescription(const PrinterAddress& address) {
    constexpr std::array kAttributes{"all", "media-col-database"};
    IppPtr request{ippNewRequest(IPP_OP_GET_PRINTER_ATTRIBUTES)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr, address.uri.c_str());
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "requesting-user-name", nullptr, cupsUser());
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                  static_cast<int>(kAttributes.size()), nullptr, kAttributes.data());
    auto connection = IppConnection::toPrinter(address.host, address.port, address.encryption);
    return connection.exchange(std::move(request), address.resource);
}

using Outcome = std::variant<TemporaryFile, std::string>;

Outcome makePPD(const std::string& deviceURI, PrinterService service) {
    const auto address = PrinterAddress::find(deviceURI, service);
    if (!address)
        return "it has no address";
    const auto loader = loadPPDGenerator();  // while the printer thinks
    const auto answer = askForDescription(*address);
    if (!answer.succeeded())
        return "it does not describe itself: " + answer.reason;
    const auto capabilities = printerCapabilities(answer.response.get(), service);
    return driverlessPPD(capabilities.get(), service);
}

}  // namespace

std::int32_t IppOptionSelection::autoSelectPPD() {
    return PrintSystemStatus::kUnavailable;  // such a printer has no driver of its own in the catalogue
}

std::int32_t IppOptionSelection::autoSelectInstallableOptions(const std::string& ppdPath) {
    newPPD_.reset();
    auto outcome = makePPD(deviceURI_, serviceFor(ppdPath));
    if (auto* ppd = std::get_if<TemporaryFile>(&outcome))
        newPPD_.hold(std::move(*ppd));
    else
        log_.error("printer " + deviceURI_ + " gets a generic driver: " + std::get<std::string>(outcome));
    return PrintSystemStatus::kSuccess;
}

}  // namespace ventras
