#include "platform/linux/scanners/ScannerServiceBrowser.h"

#include <avahi-common/malloc.h>
#include <net/if.h>

#include <algorithm>
#include <array>
#include <utility>

#include "platform/linux/scanners/NameBasedUUID.h"
#include "platform/linux/scanners/ScannerModules.h"

namespace ventras {
namespace {

constexpr std::array kServiceTypes{"_uscan._tcp", "_uscans._tcp"};
constexpr std::array kNetworkModules{"airscan", "escl"};

std::string keyOf(const std::string& name) {
    return "dns-sd:" + name;
}

bool isLoopback(AvahiIfIndex interface) {
    return interface > 0 && static_cast<unsigned>(interface) == if_nametoindex("lo");
}

// The client library hands the items over in the opposite order.
std::string recordFrom(AvahiStringList* text) {
    const std::unique_ptr<AvahiStringList, decltype(&avahi_string_list_free)> items{
        avahi_string_list_reverse(avahi_string_list_copy(text)), &avahi_string_list_free};
    std::string record(avahi_string_list_serialize(items.get(), nullptr, 0), '\0');
    record.resize(avahi_string_list_serialize(items.get(), record.data(), record.size()));
    return record;
}

std::string valueIn(AvahiStringList* text, const char* key) {
    char* value = nullptr;
    std::size_t length = 0;
    auto* item = avahi_string_list_find(text, key);
    if (item == nullptr || avahi_string_list_get_pair(item, nullptr, &value, &length) < 0 || value == nullptr)
        return "";
    const std::unique_ptr<char, decltype(&avahi_free)> owner{value, &avahi_free};
    return {value, length};
}

std::optional<std::string> networkModule() {
    for (const auto* name : kNetworkModules)
        if (auto path = scannerModuleNamed(name))
            return path;
    return std::nullopt;
}

}  // namespace

ScannerServiceBrowser::ScannerServiceBrowser(AvahiSimplePoll* poll, ScannerServices services,
                                             NetworkScannerWatch::Sink sink)
    : services_(services), sink_(std::move(sink)) {
    int error = 0;
    client_.reset(avahi_client_new(avahi_simple_poll_get(poll), AVAHI_CLIENT_NO_FAIL, onState, this, &error));
    hasFailed_ = hasFailed_ || !client_;
}

ScannerServiceBrowser::~ScannerServiceBrowser() {
    registrations_.clear();
    browsers_.clear();
    for (const auto& name : told_)
        sink_({ScannerEvent::Kind::Removed, keyOf(name), {}});
}

void ScannerServiceBrowser::onState(AvahiClient* client, AvahiClientState state, void* data) {
    auto& self = *static_cast<ScannerServiceBrowser*>(data);
    if (state == AVAHI_CLIENT_FAILURE)
        self.hasFailed_ = true;
    else if (state == AVAHI_CLIENT_S_RUNNING && self.browsers_.empty())
        self.browse(client);
}

void ScannerServiceBrowser::browse(AvahiClient* client) {
    for (const auto* type : kServiceTypes) {
        BrowserPtr browser{avahi_service_browser_new(client, AVAHI_IF_UNSPEC, AVAHI_PROTO_UNSPEC, type,
                                                     nullptr, AvahiLookupFlags{}, onService, this)};
        if (browser)
            browsers_.push_back(std::move(browser));
        else
            hasFailed_ = true;
    }
}

void ScannerServiceBrowser::onService(AvahiServiceBrowser*, AvahiIfIndex interface, AvahiProtocol protocol,
                                      AvahiBrowserEvent event, const char* name, const char* type,
                                      const char* domain, AvahiLookupResultFlags, void* data) {
    auto& self = *static_cast<ScannerServiceBrowser*>(data);
    if (event == AVAHI_BROWSER_FAILURE)
        self.hasFailed_ = true;
    else if (event == AVAHI_BROWSER_NEW)
        self.resolve({interface, protocol, name, type}, domain);
    else if (event == AVAHI_BROWSER_REMOVE)
        self.forget({interface, protocol, name, type});
}

void ScannerServiceBrowser::resolve(const Registration& registration, const char* domain) {
    const auto& [interface, protocol, name, type] = registration;
    if (services_ == ScannerServices::OfTheNetwork && isLoopback(interface))
        return;
    registrations_[registration].reset(
        avahi_service_resolver_new(client_.get(), interface, protocol, name.c_str(), type.c_str(), domain,
                                   AVAHI_PROTO_UNSPEC, AvahiLookupFlags{}, onResolved, this));
}

void ScannerServiceBrowser::onResolved(AvahiServiceResolver*, AvahiIfIndex, AvahiProtocol,
                                       AvahiResolverEvent event, const char* name, const char*, const char*,
                                       const char*, const AvahiAddress*, std::uint16_t, AvahiStringList* text,
                                       AvahiLookupResultFlags, void* data) {
    if (event == AVAHI_RESOLVER_FOUND)
        static_cast<ScannerServiceBrowser*>(data)->tellAdded(name, text);
}

void ScannerServiceBrowser::tellAdded(const std::string& name, AvahiStringList* text) {
    if (!told_.insert(name).second)
        return;
    ImageDevice scanner;
    scanner.transport = ImageDeviceTransport::kTCPIP;
    scanner.txtRecord = recordFrom(text);
    scanner.uuidString = valueIn(text, "UUID");
    if (scanner.uuidString.empty())
        scanner.uuidString = nameBasedUUID("network-scanner:" + name);
    scanner.modulePath = networkModule();
    sink_({ScannerEvent::Kind::Added, keyOf(name), std::move(scanner)});
}

void ScannerServiceBrowser::forget(const Registration& registration) {
    registrations_.erase(registration);
    const auto& name = std::get<2>(registration);
    const bool isStillThere = std::ranges::any_of(
        registrations_, [&](const auto& each) { return std::get<2>(each.first) == name; });
    if (!isStillThere && told_.erase(name) != 0)
        sink_({ScannerEvent::Kind::Removed, keyOf(name), {}});
}

}  // namespace ventras
