#include "tests/responder/ServicePublisher.h"

#include <arpa/inet.h>
#include <avahi-client/client.h>
#include <avahi-client/publish.h>
#include <avahi-common/address.h>
#include <avahi-common/domain.h>
#include <avahi-common/error.h>
#include <avahi-common/thread-watch.h>
#include <dns_sd.h>
#include <net/if.h>

#include <array>
#include <chrono>
#include <stdexcept>
#include <string_view>

namespace ventras {

struct PublisherCallbacks {
    static void clientChanged(AvahiClient*, AvahiClientState state, void* context) {
        auto& publisher = *static_cast<ServicePublisher*>(context);
        const std::lock_guard lock(publisher.mutex_);
        publisher.isReady_ = state == AVAHI_CLIENT_S_RUNNING;
        publisher.changed_.notify_all();
    }
    static void groupChanged(AvahiEntryGroup*, AvahiEntryGroupState, void*) {}
};

namespace {

constexpr std::chrono::seconds kStartLimit{20};
constexpr std::uint32_t kSecondsToLive = 120;
constexpr int kUniqueAtOnce = AVAHI_PUBLISH_UNIQUE | AVAHI_PUBLISH_NO_PROBE;
constexpr const char* kHost = "printers.local";

class PollLock {
public:
    explicit PollLock(AvahiThreadedPoll* poll) : poll_(poll) { avahi_threaded_poll_lock(poll); }
    PollLock(const PollLock&) = delete;
    PollLock& operator=(const PollLock&) = delete;
    ~PollLock() { avahi_threaded_poll_unlock(poll_); }

private:
    AvahiThreadedPoll* poll_;
};

// One part of a domain name as it goes over the wire (RFC 1035 section 3.1).
std::string label(std::string_view text) {
    return static_cast<char>(text.size()) + std::string(text);
}

std::string wireName(std::string_view name) {
    std::string wire;
    while (!name.empty()) {
        const auto dot = std::min(name.find('.'), name.size());
        wire += label(name.substr(0, dot));
        name.remove_prefix(std::min(dot + 1, name.size()));
    }
    return wire + '\0';
}

std::string srvData(std::uint16_t port, const std::string& host) {
    const std::uint16_t ordered = htons(port);
    std::string data(4, '\0');  // priority and weight
    data.append(reinterpret_cast<const char*>(&ordered), sizeof ordered);
    return data + wireName(host);
}

}  // namespace

std::string txtRecord(std::initializer_list<std::string> items) {
    std::string record;
    for (const auto& item : items)
        record += label(item);
    return record;
}

void ServicePublisher::FreePoll::operator()(AvahiThreadedPoll* poll) const {
    avahi_threaded_poll_free(poll);
}

void ServicePublisher::FreeClient::operator()(AvahiClient* client) const {
    avahi_threaded_poll_stop(poll);
    avahi_client_free(client);
}

ServicePublisher::ServicePublisher() : poll_(avahi_threaded_poll_new()), client_(nullptr, {poll_.get()}) {
    int error = 0;
    client_.reset(avahi_client_new(avahi_threaded_poll_get(poll_.get()), AVAHI_CLIENT_NO_FAIL,
                                   PublisherCallbacks::clientChanged, this, &error));
    if (!client_)
        throw std::runtime_error(std::string("no bus: ") + avahi_strerror(error));
    avahi_threaded_poll_start(poll_.get());
    waitUntilReady();
    publishHost();
}

void ServicePublisher::waitUntilReady() {
    std::unique_lock lock(mutex_);
    if (!changed_.wait_for(lock, kStartLimit, [this] { return isReady_; }))
        throw std::runtime_error("the responder is not ready");
}

// The services' host is this machine under a name of the test's own, which nobody has to be asked for.
void ServicePublisher::publishHost() {
    const std::string address{127, 0, 0, 1};
    publishRecords("lo", {{kHost, AVAHI_DNS_TYPE_A, kUniqueAtOnce, address}});
}

void ServicePublisher::publish(const PublishedService& service) {
    std::array<char, kDNSServiceMaxDomainName> fullName{};
    if (DNSServiceConstructFullName(fullName.data(), service.name.c_str(), service.type.c_str(), "local.") !=
        0)
        throw std::runtime_error("no service name: " + service.name);
    const auto type = service.type + ".local";
    std::vector<Record> records{
        {type, AVAHI_DNS_TYPE_PTR, 0, label(service.name) + wireName(type)},
        {fullName.data(), AVAHI_DNS_TYPE_SRV, kUniqueAtOnce, srvData(service.port, kHost)}};
    if (service.txt)
        records.push_back({fullName.data(), AVAHI_DNS_TYPE_TXT, kUniqueAtOnce, *service.txt});
    services_.push_back(publishRecords(service.interface, records));
}

AvahiEntryGroup* ServicePublisher::publishRecords(const std::string& interface,
                                                  const std::vector<Record>& records) {
    const PollLock lock(poll_.get());
    auto* const group = avahi_entry_group_new(client_.get(), PublisherCallbacks::groupChanged, nullptr);
    const auto index = static_cast<AvahiIfIndex>(if_nametoindex(interface.c_str()));
    for (const auto& [name, type, flags, data] : records)
        if (group == nullptr || avahi_entry_group_add_record(group, index, AVAHI_PROTO_INET,
                                                             static_cast<AvahiPublishFlags>(flags),
                                                             name.c_str(), AVAHI_DNS_CLASS_IN, type,
                                                             kSecondsToLive, data.data(), data.size()) != 0)
            throw std::runtime_error("the responder refuses " + name + ": " +
                                     avahi_strerror(avahi_client_errno(client_.get())));
    avahi_entry_group_commit(group);
    return group;
}

void ServicePublisher::withdrawAll() {
    const PollLock lock(poll_.get());
    for (auto* group : services_)
        avahi_entry_group_free(group);
    services_.clear();
}

}  // namespace ventras
