#include "platform/linux/options/PrinterAddress.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "platform/SeparatedURI.h"
#include "platform/Utf8.h"
#include "platform/linux/options/LocalServiceResolver.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

constexpr auto kServiceSuffix = "._ipp._tcp.local."sv;
constexpr auto kUUIDQuery = "?uuid="sv;
constexpr int kIppPort = 631;
constexpr int kDefaultPort = 0;  // libcups writes none then
constexpr auto kLocalHost = "localhost";
// PWG 5100.14 and PWG 5100.15: the paths under which printers offer the two services.
constexpr auto kPrintPath = "/ipp/print";
constexpr auto kFaxOutPath = "/ipp/faxout";

std::string assembled(const PrinterAddress& address) {
    std::array<char, HTTP_MAX_URI> uri{};
    const char* scheme = address.encryption == HTTP_ENCRYPTION_ALWAYS ? "ipps" : "ipp";
    const int port = address.port == kIppPort ? kDefaultPort : address.port;
    httpAssembleURI(HTTP_URI_CODING_ALL, uri.data(), static_cast<int>(uri.size()), scheme, nullptr,
                    address.host.c_str(), port, address.resource.c_str());
    return uri.data();
}

// A path from a TXT record, which has no leading slash there.
std::string pathFrom(std::string_view text, const char* otherwise) {
    text.remove_prefix(std::min(text.find_first_not_of('/'), text.size()));
    const bool usable = !text.empty() && isValidUtf8(text) && !hasControlCharacters(text);
    return usable ? "/" + std::string(text) : otherwise;
}

// Two printers of one model swap their names when they are switched on in another order; the UUID tells them
// apart, where the URI and the printer have one.
bool isAnotherPrinter(const LocalService& found, std::string_view resource) {
    const auto query = resource.find(kUUIDQuery);
    return query != std::string_view::npos && !found.uuid.empty() &&
           resource.substr(query + kUUIDQuery.size()) != found.uuid;
}

// Whatever host the record names, the device hangs on this computer.
std::optional<PrinterAddress> resolveLocal(const SeparatedURI& uri, PrinterService service) {
    if (!uri.host.ends_with(kServiceSuffix))
        return std::nullopt;
    const auto found = resolveLocalService(uri.host.substr(0, uri.host.size() - kServiceSuffix.size()));
    if (!found || isAnotherPrinter(*found, uri.resource))
        return std::nullopt;
    PrinterAddress address;
    address.host = kLocalHost;
    address.port = found->port;
    address.resource = service == PrinterService::FaxOut ? pathFrom(found->faxResource, kFaxOutPath)
                                                         : pathFrom(found->printResource, kPrintPath);
    return address;
}

PrinterAddress addressIn(const SeparatedURI& uri, PrinterService service) {
    PrinterAddress address;
    address.host = uri.host;
    address.port = uri.port;
    // What follows the path is for the scheduler's backend, e.g. "?waitjob=false".
    address.resource =
        service == PrinterService::FaxOut ? kFaxOutPath : uri.resource.substr(0, uri.resource.find('?'));
    if (uri.scheme == "ipps")
        address.encryption = HTTP_ENCRYPTION_ALWAYS;
    return address;
}

}  // namespace

std::optional<PrinterAddress> PrinterAddress::find(const std::string& deviceURI, PrinterService service) {
    const auto parts = SeparatedURI::from(deviceURI);
    if (parts.status < HTTP_URI_STATUS_OK || parts.host.empty())
        return std::nullopt;
    auto address =
        parts.scheme == "ippusb" ? resolveLocal(parts, service) : std::optional{addressIn(parts, service)};
    if (address)
        address->uri = assembled(*address);
    return address;
}

}  // namespace ventras
