#include "platform/linux/desktop/DBusCall.h"

#include "platform/Deadline.h"
#include "platform/linux/desktop/DBusConnection.h"

namespace ventras {

DBusAnswer callDBus(const DBusMethod& method, GVariant* arguments, const char* replyType,
                    std::chrono::milliseconds limit, DBusCallMode mode) {
    const auto deadline = Deadline::after(limit);
    return DBusConnection(method.bus, limit)
        .call(method, arguments, replyType, deadline.remaining(), nullptr, mode);
}

std::string emitDBusSignal(const DBusSignal& signal, GVariant* arguments, std::chrono::milliseconds limit) {
    const VariantPtr owner{g_variant_ref_sink(arguments)};
    const auto deadline = Deadline::after(limit);
    const DBusConnection connection(signal.bus, limit);
    if (connection.get() == nullptr)
        return connection.failure();

    const CancelAtDeadline cancel(deadline);
    GError* error = nullptr;
    if (g_dbus_connection_emit_signal(connection.get(), nullptr, signal.path, signal.interface, signal.name,
                                      owner.get(), &error) == FALSE ||
        g_dbus_connection_flush_sync(connection.get(), cancel.get(), &error) == FALSE)
        return takeErrorMessage(error);
    return {};
}

}  // namespace ventras
