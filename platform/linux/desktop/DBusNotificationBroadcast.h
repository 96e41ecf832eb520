#pragma once

#include "platform/NotificationBroadcast.h"

namespace ventras {

class Log;

/// Notifications as the signal Posted(s name, a{sv} userInfo) of interface com.quillon.print.Notifications,
/// object /com/quillon/print/Notifications, on the system bus. Anybody may send that signal: listeners take
/// it as a hint. Main thread only.
class DBusNotificationBroadcast : public NotificationBroadcast {
public:
    /// @param log outlives the broadcast
    explicit DBusNotificationBroadcast(Log& log) : log_(log) {}

    void post(std::string_view name, const PropertyDictionary& userInfo) override;

private:
    Log& log_;
};

}  // namespace ventras
