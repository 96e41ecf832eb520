#pragma once

#include <functional>
#include <map>

#include "platform/Deadline.h"

namespace ventras {

/// Calls a function at a deadline, on one thread that all alarms of the process share, unless it is destroyed
/// before. Setting an alarm and taking it back costs next to nothing; a thread for each would cost more than
/// most exchanges that are watched.
///
/// Any thread may construct and destroy an alarm. Once its destructor has returned, the function does not run
/// and will not run.
class Alarm {
public:
    /// What becomes of an alarm that has rung.
    enum class Afterwards { Silent, RingsAgain };

    /// Time between two rings of an alarm that rings again.
    static constexpr std::chrono::milliseconds kInterval{50};

    using Ring = std::function<Afterwards()>;

    /// @param ring neither waits for anything nor touches other alarms: they all wait for it
    Alarm(Deadline deadline, Ring ring);

    /// Starts the thread, which else the first alarm does. Any thread may call, any number of times.
    static void startThread();

    ~Alarm();
    Alarm(const Alarm&) = delete;
    Alarm& operator=(const Alarm&) = delete;

private:
    friend class AlarmThread;
    using Queue = std::multimap<Deadline::Clock::time_point, Alarm*>;

    Ring ring_;
    Queue::iterator place_;
};

}  // namespace ventras
