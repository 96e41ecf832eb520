#include "platform/ServiceRecord.h"

#include <avahi-common/malloc.h>
#include <dlfcn.h>
#include <dns_sd.h>
#include <net/if.h>
#include <poll.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>

#include "platform/Deadline.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr auto kAnswerLimit = 3000ms;    // for the responder's answer
constexpr auto kFurtherReplies = 500us;  // between replies that come in a row
constexpr auto kReleaseLimit = 200ms;    // for letting go of the query afterwards

void* allocateZeroed(std::size_t bytes) {
    return std::calloc(1, bytes);
}

constexpr AvahiAllocator kZeroingAllocator{allocateZeroed, std::free, std::realloc, std::calloc};

// Avahi's library calls through pointers that it never set when its daemon goes away during a query; in
// zeroed memory it finds null and does not. It also writes advice for programmers to standard error unless
// told not to. All that before main(): later, other threads may be reading the environment.
[[maybe_unused]] const bool kLibraryIsPrepared = [] {
    avahi_set_allocator(&kZeroingAllocator);
    return setenv("AVAHI_COMPAT_NOWARN", "1", 0) == 0;
}();

struct ReleaseService {
    void operator()(_DNSServiceRef_t* service) const { DNSServiceRefDeallocate(service); }
};
using ServicePtr = std::unique_ptr<_DNSServiceRef_t, ReleaseService>;

// What the replies to one query brought.
struct Replies {
    bool any = false;
    std::optional<std::string> record;
};

void DNSSD_API takeReply(DNSServiceRef, DNSServiceFlags, std::uint32_t, DNSServiceErrorType error,
                         const char*, std::uint16_t, std::uint16_t, std::uint16_t length, const void* data,
                         std::uint32_t, void* context) {
    auto& replies = *static_cast<Replies*>(context);
    replies.any = true;
    if (error == kDNSServiceErr_NoError && length != 0)
        replies.record.emplace(static_cast<const char*>(data), length);
}

// Avahi's library knows no local-only interface and complains on standard error whenever it is asked for it.
bool providerIsAvahi() {
    Dl_info query{}, mark{};
    const void* const symbol = dlsym(RTLD_DEFAULT, "avahi_warn_unsupported");
    const void* const function = dlsym(RTLD_DEFAULT, "DNSServiceQueryRecord");
    return symbol != nullptr && dladdr(symbol, &mark) != 0 && function != nullptr &&
           dladdr(function, &query) != 0 && mark.dli_fbase == query.dli_fbase;
}

DNSServiceErrorType startOn(std::uint32_t interface, const std::string& fullName, ServiceRecordType type,
                            ServicePtr& service, Replies& replies) {
    DNSServiceRef started = nullptr;
    const auto error =
        DNSServiceQueryRecord(&started, 0, interface, fullName.c_str(), static_cast<std::uint16_t>(type),
                              kDNSServiceClass_IN, takeReply, &replies);
    if (error == kDNSServiceErr_NoError)
        service.reset(started);
    return error;
}

// What is registered for this machine alone is found on the local-only interface or, with a responder that
// has none, on loopback. "Any interface" would also find a stranger's printer on the network.
ServicePtr start(const std::string& fullName, ServiceRecordType type, Replies& replies) {
    ServicePtr service;
    if (!providerIsAvahi() && startOn(kDNSServiceInterfaceIndexLocalOnly, fullName, type, service, replies) !=
                                  kDNSServiceErr_Unsupported)
        return service;
    if (const auto loopback = if_nametoindex("lo"); loopback != 0)
        startOn(loopback, fullName, type, service, replies);
    return service;
}

bool becomesReadable(int descriptor, std::chrono::microseconds limit) {
    const auto whole = std::chrono::floor<std::chrono::seconds>(limit);
    const timespec time{whole.count(), std::chrono::nanoseconds(limit - whole).count()};
    pollfd waiting{descriptor, POLLIN, 0};
    int ready = 0;
    do
        ready = ppoll(&waiting, 1, &time, nullptr);
    while (ready < 0 && errno == EINTR);
    return ready > 0;
}

std::optional<std::string> query(const std::string& fullName, ServiceRecordType type, Deadline deadline) {
    Replies replies;
    const auto service = start(fullName, type, replies);
    if (!service)
        return std::nullopt;
    const int socket = DNSServiceRefSockFD(service.get());
    // The library's socket also wakes for its own talk with the daemon, so only a reply ends the long wait.
    while (!replies.record && !deadline.passed() &&
           becomesReadable(socket, replies.any ? kFurtherReplies : deadline.remaining()) &&
           DNSServiceProcessResult(service.get()) == kDNSServiceErr_NoError) {
    }
    return replies.record;
}

// Where a helper thread leaves what it found; both sides own it, as either may be gone before the other.
struct Outcome {
    std::mutex mutex;
    std::condition_variable changed;
    bool isKnown = false;
    std::optional<std::string> record;
};

}  // namespace

std::optional<std::string> ippServiceFullName(const std::string& registeredName) {
    std::array<char, kDNSServiceMaxDomainName> fullName{};
    if (DNSServiceConstructFullName(fullName.data(), registeredName.c_str(), "_ipp._tcp.", "local.") != 0)
        return std::nullopt;
    return fullName.data();
}

std::optional<std::string> queryLocalServiceRecord(const std::string& fullName, ServiceRecordType type) {
    const auto outcome = std::make_shared<Outcome>();
    const auto deadline = Deadline::after(kAnswerLimit);
    // A daemon that hangs holds the library's calls for 25 s, so they run where nobody waits for them.
    const auto ask = [outcome, deadline, fullName, type] {
        auto record = query(fullName, type, deadline);
        const std::lock_guard lock(outcome->mutex);
        outcome->record = std::move(record);
        outcome->isKnown = true;
        outcome->changed.notify_one();
    };
    try {
        std::thread(ask).detach();
    } catch (const std::system_error&) {
        return std::nullopt;
    }
    std::unique_lock lock(outcome->mutex);
    outcome->changed.wait_until(lock, deadline.moment() + kReleaseLimit, [&] { return outcome->isKnown; });
    return outcome->record;
}

}  // namespace ventras
