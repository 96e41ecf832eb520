#pragma once

#include <condition_variable>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

struct AvahiClient;
struct AvahiEntryGroup;
struct AvahiThreadedPoll;

namespace ventras {

/// A DNS-SD service as a daemon of this machine registers it, on loopback alone.
struct PublishedService {
    std::string name;
    std::uint16_t port = 9;
    std::optional<std::string> txt =
        std::string(1, '\0');  ///< the record's bytes; absent: there is no TXT record
    std::string type = "_ipp._tcp";
    std::string interface = "lo";
};

/// The bytes of a TXT record (RFC 6763 section 6) of these items, each as it stands: "key=value", "key=",
/// "key".
std::string txtRecord(std::initializer_list<std::string> items);

/// Registers services with the responder of the system bus, at once and without asking the network whether
/// the name is free, and withdraws them in the end. One thread at a time.
class ServicePublisher {
public:
    /// @throw std::runtime_error when the responder is not ready in time.
    ServicePublisher();
    ServicePublisher(const ServicePublisher&) = delete;
    ServicePublisher& operator=(const ServicePublisher&) = delete;

    /// Adds a service.
    /// @throw std::runtime_error when the responder refuses it.
    void publish(const PublishedService& service);

    /// Takes back every service.
    void withdrawAll();

private:
    struct Record {
        std::string name;
        std::uint16_t type;
        int flags;
        std::string data;
    };

    void waitUntilReady();
    void publishHost();
    AvahiEntryGroup* publishRecords(const std::string& interface, const std::vector<Record>& records);

    struct FreePoll {
        void operator()(AvahiThreadedPoll* poll) const;
    };
    struct FreeClient {
        AvahiThreadedPoll* poll;
        void operator()(AvahiClient* client) const;
    };

    std::mutex mutex_;
    std::condition_variable changed_;
    bool isReady_ = false;
    std::unique_ptr<AvahiThreadedPoll, FreePoll> poll_;
    std::unique_ptr<AvahiClient, FreeClient> client_;
    std::vector<AvahiEntryGroup*> services_;
    friend struct PublisherCallbacks;
};

}  // namespace ventras
