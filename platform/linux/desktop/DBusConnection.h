#pragma once

#include <chrono>
#include <string>

#include "platform/Alarm.h"
#include "platform/Deadline.h"
#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// Cancels what takes a cancellable when the time is over: connecting and flushing have no time limit of
/// their own in GLib. One thread at a time.
class CancelAtDeadline {
public:
    explicit CancelAtDeadline(Deadline deadline);

    GCancellable* get() const { return cancellable_.get(); }

private:
    GObjectPtr<GCancellable> cancellable_;
    Alarm alarm_;
};

/// A connection of one's own to a message bus, closed with its owner. GLib's shared ones outlive a bus that
/// goes away, and end the process then. Any thread may call; signals go to the main context that was the
/// thread's default when it was made.
class DBusConnection {
public:
    /// Connects, for at most `limit`; looks for no bus, and starts none, where there is none.
    DBusConnection(Bus bus, std::chrono::milliseconds limit);
    DBusConnection(const DBusConnection&) = delete;
    DBusConnection& operator=(const DBusConnection&) = delete;
    ~DBusConnection();

    /// Null when it could not be made.
    GDBusConnection* get() const { return connection_.get(); }

    /// Why it could not be made, for people.
    const std::string& failure() const { return failure_; }

    /// Calls a method, and waits for its answer for at most `limit`. The method's bus is this one's.
    /// @param arguments a tuple; a floating reference is consumed
    /// @param replyType of the tuple that comes back; another type is a failure
    /// @param cancellable ends the wait from another thread; may be null
    DBusAnswer call(const DBusMethod& method, GVariant* arguments, const char* replyType,
                    std::chrono::milliseconds limit, GCancellable* cancellable = nullptr,
                    DBusCallMode mode = DBusCallMode::Plain) const;

private:
    GObjectPtr<GDBusConnection> connection_;
    std::string failure_;
};

/// The text of an error, which it takes, without the name that D-Bus puts in front.
std::string takeErrorMessage(GError* error);

}  // namespace ventras
