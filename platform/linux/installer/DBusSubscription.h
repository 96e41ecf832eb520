#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "platform/linux/desktop/DBusConnection.h"

namespace ventras {

/// The signals of one object of one process on a bus, for as long as it lives. It belongs to the thread whose
/// EventContext was there when the connection was made.
class DBusSubscription {
public:
    /// @param member the signal's name
    using Handler = std::function<void(std::string_view member, GVariant* arguments)>;

    /// @param sender the process's unique name: anybody may send signals in the name of anybody's object
    /// @param firstArgument that a signal must have; null = any
    DBusSubscription(const DBusConnection& connection, const std::string& sender, const char* interface,
                     const std::string& path, Handler handler, const char* firstArgument = nullptr);
    DBusSubscription(const DBusSubscription&) = delete;
    DBusSubscription& operator=(const DBusSubscription&) = delete;
    ~DBusSubscription();

private:
    Handler handler_;
    GDBusConnection* connection_;
    guint id_;
};

/// The process behind a service, watched: a service that goes away answers nothing more.
class DBusService {
public:
    /// @param service runs already
    DBusService(const DBusConnection& connection, const char* service);

    /// Its unique name; empty when it does not run.
    const std::string& owner() const { return owner_; }

    /// Whether it went away, or the bus did.
    bool isLost() const;

private:
    const DBusConnection& connection_;
    bool hasChanged_ = false;
    DBusSubscription changes_;
    std::string owner_;
};

}  // namespace ventras
