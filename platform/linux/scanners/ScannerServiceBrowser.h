#pragma once

#include <avahi-client/client.h>
#include <avahi-client/lookup.h>
#include <avahi-common/simple-watch.h>

#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <tuple>
#include <vector>

#include "platform/linux/ReleaseWith.h"
#include "platform/linux/scanners/NetworkScannerWatch.h"

namespace ventras {

/// One connection to the responder that browses for scanner services and tells each scanner once, however
/// many interfaces, protocols and service types it is registered with. Belongs to the thread that runs
/// `poll`.
class ScannerServiceBrowser {
public:
    ScannerServiceBrowser(AvahiSimplePoll* poll, ScannerServices services, NetworkScannerWatch::Sink sink);

    /// Tells all its scanners as gone.
    ~ScannerServiceBrowser();
    ScannerServiceBrowser(const ScannerServiceBrowser&) = delete;
    ScannerServiceBrowser& operator=(const ScannerServiceBrowser&) = delete;

    /// Whether the connection is lost, or never came about; a new browser has to take its place.
    bool hasFailed() const { return hasFailed_; }

private:
    // Interface, protocol, name and type.
    using Registration = std::tuple<AvahiIfIndex, AvahiProtocol, std::string, std::string>;

    using ClientPtr = std::unique_ptr<AvahiClient, ReleaseWith<avahi_client_free>>;
    using BrowserPtr = std::unique_ptr<AvahiServiceBrowser, ReleaseWith<avahi_service_browser_free>>;
    using ResolverPtr = std::unique_ptr<AvahiServiceResolver, ReleaseWith<avahi_service_resolver_free>>;

    static void onState(AvahiClient* client, AvahiClientState state, void* self);
    static void onService(AvahiServiceBrowser* browser, AvahiIfIndex interface, AvahiProtocol protocol,
                          AvahiBrowserEvent event, const char* name, const char* type, const char* domain,
                          AvahiLookupResultFlags flags, void* self);
    static void onResolved(AvahiServiceResolver* resolver, AvahiIfIndex interface, AvahiProtocol protocol,
                           AvahiResolverEvent event, const char* name, const char* type, const char* domain,
                           const char* host, const AvahiAddress* address, std::uint16_t port,
                           AvahiStringList* text, AvahiLookupResultFlags flags, void* self);

    void browse(AvahiClient* client);
    void resolve(const Registration& registration, const char* domain);
    void tellAdded(const std::string& name, AvahiStringList* text);
    void forget(const Registration& registration);

    ScannerServices services_;
    NetworkScannerWatch::Sink sink_;
    bool hasFailed_ = false;
    ClientPtr client_;
    std::vector<BrowserPtr> browsers_;
    std::map<Registration, ResolverPtr> registrations_;
    std::set<std::string> told_;  // names
};

}  // namespace ventras
