#include "data/ippusb/PrinterWatch.h"

#include <avahi-client/client.h>
#include <avahi-client/lookup.h>
#include <avahi-common/error.h>
#include <avahi-common/simple-watch.h>
#include <net/if.h>

#include <algorithm>
#include <array>

namespace ventras {
namespace {

constexpr const char* kPrinterType = "_ipp._tcp";
constexpr const char* kUsbType = "_ipp-usb._tcp";

AvahiIfIndex loopback() {
    return static_cast<AvahiIfIndex>(if_nametoindex("lo"));
}

}  // namespace

struct PrinterWatchCallbacks {
    static void clientChanged(AvahiClient* client, AvahiClientState state, void* context) {
        auto& watch = *static_cast<PrinterWatch*>(context);
        watch.client_ = client;
        if (state == AVAHI_CLIENT_S_RUNNING)
            watch.browse();
        else if (state == AVAHI_CLIENT_FAILURE)
            watch.fail(avahi_strerror(avahi_client_errno(client)));
    }

    static void browsed(AvahiServiceBrowser*, AvahiIfIndex, AvahiProtocol, AvahiBrowserEvent event,
                        const char* name, const char* type, const char*, AvahiLookupResultFlags,
                        void* context) {
        auto& watch = *static_cast<PrinterWatch*>(context);
        if (event == AVAHI_BROWSER_NEW)
            watch.appeared({type, name});
        else if (event == AVAHI_BROWSER_REMOVE)
            watch.disappeared({type, name});
        else if (event == AVAHI_BROWSER_FAILURE)
            watch.fail(avahi_strerror(avahi_client_errno(watch.client_)));
    }

    static void resolved(AvahiServiceResolver*, AvahiIfIndex, AvahiProtocol, AvahiResolverEvent event,
                         const char* name, const char* type, const char*, const char*, const AvahiAddress*,
                         std::uint16_t port, AvahiStringList*, AvahiLookupResultFlags, void* context) {
        if (event == AVAHI_RESOLVER_FOUND)
            static_cast<PrinterWatch*>(context)->resolved({type, name}, port);
    }
};

PrinterWatch::PrinterWatch(std::function<void(const std::string& name)> found)
    : found_(std::move(found)), poll_(avahi_simple_poll_new()) {}

PrinterWatch::~PrinterWatch() {
    if (client_ != nullptr)
        avahi_client_free(client_);  // and with it all that it looks for
    avahi_simple_poll_free(poll_);
}

std::string PrinterWatch::run() {
    int error = 0;
    // Without the flag a responder that starts later than this program would be a failure.
    client_ = avahi_client_new(avahi_simple_poll_get(poll_), AVAHI_CLIENT_NO_FAIL,
                               PrinterWatchCallbacks::clientChanged, this, &error);
    if (client_ == nullptr)
        return avahi_strerror(error);
    avahi_simple_poll_loop(poll_);
    return failure_;
}

void PrinterWatch::browse() {
    if (isBrowsing_)
        return;
    isBrowsing_ = true;
    for (const char* type : {kUsbType, kPrinterType})
        if (avahi_service_browser_new(client_, loopback(), AVAHI_PROTO_UNSPEC, type, nullptr,
                                      AvahiLookupFlags{}, PrinterWatchCallbacks::browsed, this) == nullptr)
            fail(avahi_strerror(avahi_client_errno(client_)));
}

void PrinterWatch::appeared(const Service& service) {
    if (resolvers_.contains(service))
        return;  // known by the other IP version
    constexpr auto kNoAddress = static_cast<AvahiLookupFlags>(AVAHI_LOOKUP_NO_ADDRESS | AVAHI_LOOKUP_NO_TXT);
    resolvers_[service] = avahi_service_resolver_new(
        client_, loopback(), AVAHI_PROTO_UNSPEC, service.second.c_str(), service.first.c_str(), "local",
        AVAHI_PROTO_UNSPEC, kNoAddress, PrinterWatchCallbacks::resolved, this);
}

void PrinterWatch::resolved(const Service& service, std::uint16_t port) {
    ports_[service] = port;
    for (const auto& entry : ports_) {
        const auto isUsbTwin = [&](const auto& other) {
            return other.first.first == kUsbType && other.second == entry.second;
        };
        const auto& [type, name] = entry.first;
        if (type == kPrinterType && std::ranges::any_of(ports_, isUsbTwin) && announced_.insert(name).second)
            found_(name);
    }
}

void PrinterWatch::disappeared(const Service& service) {
    if (const auto resolver = resolvers_.find(service); resolver != resolvers_.end()) {
        if (resolver->second != nullptr)
            avahi_service_resolver_free(resolver->second);
        resolvers_.erase(resolver);
    }
    ports_.erase(service);
    if (service.first == kPrinterType)
        announced_.erase(service.second);
}

void PrinterWatch::fail(const std::string& why) {
    failure_ = why;
    avahi_simple_poll_quit(poll_);
}

}  // namespace ventras
