#include "platform/Alarm.h"

#include <condition_variable>
#include <mutex>
#include <thread>
#include <utility>

namespace ventras {

class AlarmThread {
public:
    static AlarmThread& shared();

    void add(Alarm& alarm, Alarm::Queue::key_type moment);
    void remove(Alarm& alarm);

private:
    static constexpr auto kNever = Alarm::Queue::key_type::max();

    void watch();
    void ringFirst();

    std::mutex mutex_;
    std::condition_variable sooner_;
    Alarm::Queue alarms_;
    Alarm::Queue::key_type wakesAt_ = Alarm::Queue::key_type::min();  // while it does not sleep
};

// Never freed, and its thread never joined: others may still be in the middle of an exchange while the
// process ends.
AlarmThread& AlarmThread::shared() {
    static auto& shared = *[] {
        auto* made = new AlarmThread;
        std::thread([made] { made->watch(); }).detach();
        return made;
    }();
    return shared;
}

void AlarmThread::add(Alarm& alarm, Alarm::Queue::key_type moment) {
    const std::lock_guard lock(mutex_);
    alarm.place_ = alarms_.emplace(moment, &alarm);
    if (moment < wakesAt_)
        sooner_.notify_one();
}

void AlarmThread::remove(Alarm& alarm) {
    const std::lock_guard lock(mutex_);
    if (alarm.place_ != alarms_.end())
        alarms_.erase(alarm.place_);
}

// Alarms are nearly always taken back long before their time. The thread is not woken for that: it finds out
// when it wakes.
void AlarmThread::watch() {
    std::unique_lock lock(mutex_);
    for (;;) {
        if (!alarms_.empty() && alarms_.begin()->first <= Deadline::Clock::now()) {
            ringFirst();
            continue;
        }
        wakesAt_ = alarms_.empty() ? kNever : alarms_.begin()->first;
        if (alarms_.empty())
            sooner_.wait(lock);
        else
            sooner_.wait_until(lock, wakesAt_);
        wakesAt_ = Alarm::Queue::key_type::min();
    }
}

void AlarmThread::ringFirst() {
    auto node = alarms_.extract(alarms_.begin());
    auto& alarm = *node.mapped();
    alarm.place_ = alarms_.end();
    if (alarm.ring_() == Alarm::Afterwards::Silent)
        return;
    node.key() = Deadline::Clock::now() + Alarm::kInterval;
    alarm.place_ = alarms_.insert(std::move(node));
}

Alarm::Alarm(Deadline deadline, Ring ring) : ring_(std::move(ring)) {
    AlarmThread::shared().add(*this, deadline.moment());
}

void Alarm::startThread() {
    AlarmThread::shared();
}

Alarm::~Alarm() {
    AlarmThread::shared().remove(*this);
}

}  // namespace ventras
