#include "tests/ippusb/ScriptedDNSSD.h"

#include <sys/timerfd.h>
#include <unistd.h>

#include <condition_variable>
#include <cstddef>
#include <mutex>

// The library's handle, whose content is its own affair.
struct _DNSServiceRef_t {
    int timer = -1;
    std::vector<ventras::ScriptedWakeUp> wakeUps;
    std::size_t next = 0;
    DNSServiceQueryRecordReply callback = nullptr;
    void* context = nullptr;

    void armNext() const {
        itimerspec time{};
        if (next < wakeUps.size()) {
            const auto nanoseconds = std::chrono::nanoseconds(wakeUps[next].after).count() + 1;
            time.it_value = {nanoseconds / 1'000'000'000, nanoseconds % 1'000'000'000};
        }
        timerfd_settime(timer, 0, &time, nullptr);
    }
};

namespace ventras {
namespace {

std::mutex mutex;
std::condition_variable changed;
ScriptedDNSSD* script = nullptr;
std::vector<QueryCall> startedQueries;
int aliveQueries = 0;
int hangingStarts = 0;
bool isReleased = false;

}  // namespace

ScriptedDNSSD::ScriptedDNSSD() {
    const std::lock_guard lock(mutex);
    script = this;
    startedQueries.clear();
    isReleased = false;
}

ScriptedDNSSD::~ScriptedDNSSD() {
    release();
    const std::lock_guard lock(mutex);
    script = nullptr;
}

std::vector<QueryCall> ScriptedDNSSD::calls() const {
    const std::lock_guard lock(mutex);
    return startedQueries;
}

int ScriptedDNSSD::alive() const {
    const std::lock_guard lock(mutex);
    return aliveQueries;
}

void ScriptedDNSSD::release() {
    std::unique_lock lock(mutex);
    isReleased = true;
    changed.notify_all();
    changed.wait(lock, [] { return aliveQueries == 0 && hangingStarts == 0; });
}

ScriptedQuery ScriptedDNSSD::answering(std::string record) {
    return {.wakeUps = {{.record = std::move(record)}}};
}

}  // namespace ventras

using ventras::ScriptedWakeUp;

DNSServiceErrorType DNSSD_API DNSServiceQueryRecord(DNSServiceRef* service, DNSServiceFlags flags,
                                                    std::uint32_t interface, const char* fullName,
                                                    std::uint16_t type, std::uint16_t recordClass,
                                                    DNSServiceQueryRecordReply callback, void* context) {
    std::unique_lock lock(ventras::mutex);
    ventras::startedQueries.push_back({flags, interface, fullName, type, recordClass});
    if (ventras::script == nullptr)
        return kDNSServiceErr_Unknown;
    const auto scripted = ventras::script->queries.find(interface);
    if (scripted == ventras::script->queries.end())
        return kDNSServiceErr_Unknown;
    const auto query = scripted->second;
    if (query.hangs) {
        ++ventras::hangingStarts;
        ventras::changed.wait(lock, [] { return ventras::isReleased; });
        --ventras::hangingStarts;
        ventras::changed.notify_all();
    }
    if (query.error != kDNSServiceErr_NoError)
        return query.error;
    ++ventras::aliveQueries;
    *service = new _DNSServiceRef_t{timerfd_create(CLOCK_MONOTONIC, TFD_CLOEXEC), query.wakeUps, 0, callback,
                                    context};
    (*service)->armNext();
    return kDNSServiceErr_NoError;
}

int DNSSD_API DNSServiceRefSockFD(DNSServiceRef service) {
    return service->timer;
}

DNSServiceErrorType DNSSD_API DNSServiceProcessResult(DNSServiceRef service) {
    std::uint64_t expirations = 0;
    if (read(service->timer, &expirations, sizeof expirations) < 0)
        return kDNSServiceErr_Unknown;
    const auto wakeUp = service->wakeUps.at(service->next++);
    service->armNext();
    if (wakeUp.kind == ScriptedWakeUp::Kind::Failure)
        return kDNSServiceErr_Unknown;
    if (wakeUp.kind == ScriptedWakeUp::Kind::Reply)
        service->callback(service, kDNSServiceFlagsAdd, 1, wakeUp.error, nullptr, kDNSServiceType_TXT,
                          kDNSServiceClass_IN, static_cast<std::uint16_t>(wakeUp.record.size()),
                          wakeUp.record.data(), 0, service->context);
    return kDNSServiceErr_NoError;
}

void DNSSD_API DNSServiceRefDeallocate(DNSServiceRef service) {
    close(service->timer);
    delete service;
    const std::lock_guard lock(ventras::mutex);
    --ventras::aliveQueries;
    ventras::changed.notify_all();
}
