#include "platform/linux/desktop/DBusCall.h"

#include <unistd.h>

#include <algorithm>
#include <condition_variable>
#include <cstdlib>
#include <mutex>
#include <thread>

#include "platform/Deadline.h"

namespace ventras {
namespace {

// Connecting and flushing have no time limit of their own in GLib, but they can be cancelled.
class CancelAtDeadline {
public:
    explicit CancelAtDeadline(Deadline deadline) : cancellable_(g_cancellable_new()) {
        watcher_ = std::jthread([this, deadline](const std::stop_token& stop) {
            std::unique_lock lock(mutex_);
            stopped_.wait_until(lock, stop, deadline.moment(), [] { return false; });
            if (!stop.stop_requested())
                g_cancellable_cancel(cancellable_.get());
        });
    }

    GCancellable* get() const { return cancellable_.get(); }

private:
    GObjectPtr<GCancellable> cancellable_;
    std::mutex mutex_;
    std::condition_variable_any stopped_;
    std::jthread watcher_;
};

std::string takeMessage(GError* error) {
    const GErrorPtr owner{error};
    if (error == nullptr)
        return "unknown failure";
    g_dbus_error_strip_remote_error(error);
    return error->message;
}

bool isSocketThere(const std::string& path) {
    return access(path.c_str(), F_OK) == 0;
}

// GLib would look for a bus in vain, and for a session bus even start one, which takes its time.
bool isBusThere(Bus bus) {
    if (bus == Bus::System)
        return std::getenv("DBUS_SYSTEM_BUS_ADDRESS") != nullptr ||
               isSocketThere("/run/dbus/system_bus_socket") ||
               isSocketThere("/var/run/dbus/system_bus_socket");
    if (std::getenv("DBUS_SESSION_BUS_ADDRESS") != nullptr)
        return true;
    const char* runtimeFolder = std::getenv("XDG_RUNTIME_DIR");
    return runtimeFolder != nullptr && isSocketThere(std::string(runtimeFolder) + "/bus");
}

// A connection for one call. GLib's shared ones outlive a bus that goes away, and end the process then.
class Connection {
public:
    Connection(Bus bus, GCancellable* cancellable) {
        if (!isBusThere(bus)) {
            failure_ = bus == Bus::System ? "there is no system bus" : "there is no session bus";
            return;
        }
        const auto type = bus == Bus::System ? G_BUS_TYPE_SYSTEM : G_BUS_TYPE_SESSION;
        constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
            G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
        GError* error = nullptr;
        const GTextPtr address{g_dbus_address_get_for_bus_sync(type, cancellable, &error)};
        if (address)
            connection_.reset(
                g_dbus_connection_new_for_address_sync(address.get(), kFlags, nullptr, cancellable, &error));
        if (!connection_)
            failure_ = takeMessage(error);
    }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;
    ~Connection() {
        // Not waiting: a bus that hangs would keep us here.
        if (connection_)
            g_dbus_connection_close(connection_.get(), nullptr, nullptr, nullptr);
    }

    GDBusConnection* get() const { return connection_.get(); }
    const std::string& failure() const { return failure_; }

private:
    GObjectPtr<GDBusConnection> connection_;
    std::string failure_;
};

GDBusCallFlags flagsOf(DBusCallMode mode) {
    switch (mode) {
        case DBusCallMode::RunningOnly:
            return G_DBUS_CALL_FLAGS_NO_AUTO_START;
        case DBusCallMode::MayAskTheUser:
            return G_DBUS_CALL_FLAGS_ALLOW_INTERACTIVE_AUTHORIZATION;
        case DBusCallMode::Plain:
            break;
    }
    return G_DBUS_CALL_FLAGS_NONE;
}

VariantPtr takeFloating(GVariant* variant) {
    return VariantPtr{g_variant_ref_sink(variant)};
}

}  // namespace

DBusAnswer callDBus(const DBusMethod& method, GVariant* arguments, const char* replyType,
                    std::chrono::milliseconds limit, DBusCallMode mode) {
    const auto owner = takeFloating(arguments);
    const auto deadline = Deadline::after(limit);
    const CancelAtDeadline cancel(deadline);
    const Connection connection(method.bus, cancel.get());
    if (connection.get() == nullptr)
        return {nullptr, connection.failure()};

    const auto left = std::max<std::chrono::milliseconds::rep>(deadline.remaining().count(), 1);
    GError* error = nullptr;
    DBusAnswer answer;
    answer.reply.reset(g_dbus_connection_call_sync(
        connection.get(), method.service, method.path, method.interface, method.name, owner.get(),
        G_VARIANT_TYPE(replyType), flagsOf(mode), static_cast<gint>(left), cancel.get(), &error));
    if (!answer.reply)
        answer.failure = takeMessage(error);
    return answer;
}

std::string emitDBusSignal(const DBusSignal& signal, GVariant* arguments, std::chrono::milliseconds limit) {
    const auto owner = takeFloating(arguments);
    const CancelAtDeadline cancel(Deadline::after(limit));
    const Connection connection(signal.bus, cancel.get());
    if (connection.get() == nullptr)
        return connection.failure();

    GError* error = nullptr;
    if (g_dbus_connection_emit_signal(connection.get(), nullptr, signal.path, signal.interface, signal.name,
                                      owner.get(), &error) == FALSE ||
        g_dbus_connection_flush_sync(connection.get(), cancel.get(), &error) == FALSE)
        return takeMessage(error);
    return {};
}

}  // namespace ventras
