#include "platform/linux/desktop/DBusConnection.h"

#include <unistd.h>

#include <algorithm>
#include <cstdlib>

namespace ventras {
namespace {

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

}  // namespace

CancelAtDeadline::CancelAtDeadline(Deadline deadline)
    : cancellable_(g_cancellable_new()), alarm_(deadline, [cancellable = cancellable_.get()] {
          g_cancellable_cancel(cancellable);
          return Alarm::Afterwards::Silent;
      }) {}

DBusConnection::DBusConnection(Bus bus, std::chrono::milliseconds limit) {
    if (!isBusThere(bus)) {
        failure_ = bus == Bus::System ? "there is no system bus" : "there is no session bus";
        return;
    }
    const CancelAtDeadline cancel(Deadline::after(limit));
    const auto type = bus == Bus::System ? G_BUS_TYPE_SYSTEM : G_BUS_TYPE_SESSION;
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    GError* error = nullptr;
    const GTextPtr address{g_dbus_address_get_for_bus_sync(type, cancel.get(), &error)};
    if (address)
        connection_.reset(
            g_dbus_connection_new_for_address_sync(address.get(), kFlags, nullptr, cancel.get(), &error));
    if (!connection_)
        failure_ = takeErrorMessage(error);
}

DBusConnection::~DBusConnection() {
    // Not waiting: a bus that hangs would keep us here.
    if (connection_)
        g_dbus_connection_close(connection_.get(), nullptr, nullptr, nullptr);
}

DBusAnswer DBusConnection::call(const DBusMethod& method, GVariant* arguments, const char* replyType,
                                std::chrono::milliseconds limit, GCancellable* cancellable,
                                DBusCallMode mode) const {
    const VariantPtr owner{g_variant_ref_sink(arguments)};
    if (!connection_)
        return {nullptr, failure_};
    const auto milliseconds = std::max<std::chrono::milliseconds::rep>(limit.count(), 1);
    GError* error = nullptr;
    DBusAnswer answer;
    answer.reply.reset(g_dbus_connection_call_sync(
        connection_.get(), method.service, method.path, method.interface, method.name, owner.get(),
        G_VARIANT_TYPE(replyType), flagsOf(mode), static_cast<gint>(milliseconds), cancellable, &error));
    if (!answer.reply)
        answer.failure = takeErrorMessage(error);
    return answer;
}

std::string takeErrorMessage(GError* error) {
    const GErrorPtr owner{error};
    if (error == nullptr)
        return "unknown failure";
    g_dbus_error_strip_remote_error(error);
    return error->message;
}

}  // namespace ventras
