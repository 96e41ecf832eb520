#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <utility>

struct AvahiClient;
struct AvahiServiceBrowser;
struct AvahiServiceResolver;
struct AvahiSimplePoll;

namespace ventras {

/// Watches DNS-SD on loopback for printers that the daemon for IPP over USB registers: IPP services at a port
/// where there is an "_ipp-usb._tcp" service, too. Other IPP services of this machine, such as shared queues,
/// are none. One thread.
class PrinterWatch {
public:
    /// @param found called with the name of each printer that is there or appears, once for each time it
    /// appears
    explicit PrinterWatch(std::function<void(const std::string& name)> found);
    PrinterWatch(const PrinterWatch&) = delete;
    PrinterWatch& operator=(const PrinterWatch&) = delete;
    ~PrinterWatch();

    /// Watches until the responder goes away.
    /// @return why it ended.
    std::string run();

private:
    friend struct PrinterWatchCallbacks;
    using Service = std::pair<std::string, std::string>;  // type and name

    void browse();
    void appeared(const Service& service);
    void resolved(const Service& service, std::uint16_t port);
    void disappeared(const Service& service);
    void fail(const std::string& why);

    std::function<void(const std::string& name)> found_;
    AvahiSimplePoll* poll_ = nullptr;
    AvahiClient* client_ = nullptr;
    std::map<Service, AvahiServiceResolver*> resolvers_;
    std::map<Service, std::uint16_t> ports_;
    std::set<std::string> announced_;
    bool isBrowsing_ = false;
    std::string failure_;
};

}  // namespace ventras
