#include "platform/HostAddresses.h"

#include <arpa/inet.h>
#include <strings.h>
#include <sys/un.h>

#include <cerrno>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>
#include <utility>

namespace ventras {
namespace {

HostAddresses resolve(const std::string& host, int port) {
    HostAddresses found;
    found.list.reset(httpAddrGetList(host.c_str(), AF_UNSPEC, std::to_string(port).c_str()));
    if (!found.list)
        found.failure = cupsLastErrorString();
    return found;
}

// Nobody is asked about these: paths, and addresses as numbers.
bool needsNoResolver(const std::string& host) {
    in_addr address{};
    return host.starts_with('/') || host.find(':') != std::string::npos ||
           inet_aton(host.c_str(), &address) != 0;
}

// RFC 6761 section 6.3: whoever resolves names knows this one, and asks nobody.
HostAddresses ownAddresses(int port) {
    auto found = resolve("::1", port);
    auto second = resolve("127.0.0.1", port);
    if (!found.list)
        return second;
    auto* last = found.list.get();
    while (last->next != nullptr)
        last = last->next;
    last->next = second.list.release();
    return found;
}

// A lookup that its caller may have given up. The last of the two to let go frees the answer.
struct Lookup {
    std::mutex mutex;
    std::condition_variable done;
    bool isDone = false;
    HostAddresses found;
};

HostAddresses resolveBy(Deadline deadline, const std::string& host, int port) {
    const auto lookup = std::make_shared<Lookup>();
    const auto ask = [lookup, host, port] {
        auto found = resolve(host, port);
        const std::lock_guard lock(lookup->mutex);
        lookup->found = std::move(found);
        lookup->isDone = true;
        lookup->done.notify_one();
    };
    try {
        std::thread(ask).detach();
    } catch (const std::system_error& tooMany) {
        return {nullptr, std::string("no thread can be started to look its name up: ") + tooMany.what()};
    }

    std::unique_lock lock(lookup->mutex);
    if (!lookup->done.wait_until(lock, deadline.moment(), [&] { return lookup->isDone; }))
        return {nullptr, "no name server tells its address in time"};
    return std::move(lookup->found);
}

}  // namespace

HostAddresses HostAddresses::find(const std::string& host, int port, Deadline deadline) {
    // libcups would cut such a path, and reach whoever is there.
    if (host.starts_with('/') && host.size() >= sizeof sockaddr_un::sun_path)
        return {nullptr, std::generic_category().message(ENAMETOOLONG)};
    if (needsNoResolver(host))
        return resolve(host, port);
    if (strcasecmp(host.c_str(), "localhost") == 0)
        return ownAddresses(port);
    return resolveBy(deadline, host, port);
}

}  // namespace ventras
