// GIO's functions, as far as this system calls them, each found when it is first called. A program that is
// linked with this file starts without GIO and all that it brings along, which else takes an eighth of the
// time in which the agent makes a queue, in runs that never talk to a message bus. What is missing here comes
// from the library itself, as if this file were not there; then it is loaded at the start again.
#include <dlfcn.h>
#include <gio/gio.h>

namespace {

void* library() {
    static void* const gio = [] {
        void* const loaded = dlopen("libgio-2.0.so.0", RTLD_LAZY | RTLD_LOCAL);
        if (loaded == nullptr)
            g_error("%s", dlerror());  // as the system's loader would end a program that lacks a library
        return loaded;
    }();
    return gio;
}

template <typename Function>
Function* find(const char* name) {
    auto* const function = reinterpret_cast<Function*>(dlsym(library(), name));
    if (function == nullptr)
        g_error("%s", dlerror());
    return function;
}

}  // namespace

void g_object_unref(gpointer object) {
    static auto* const function = find<decltype(g_object_unref)>("g_object_unref");
    function(object);
}

GCancellable* g_cancellable_new() {
    static auto* const function = find<decltype(g_cancellable_new)>("g_cancellable_new");
    return function();
}

void g_cancellable_cancel(GCancellable* cancellable) {
    static auto* const function = find<decltype(g_cancellable_cancel)>("g_cancellable_cancel");
    function(cancellable);
}

gchar* g_dbus_address_get_for_bus_sync(GBusType type, GCancellable* cancellable, GError** error) {
    static auto* const function =
        find<decltype(g_dbus_address_get_for_bus_sync)>("g_dbus_address_get_for_bus_sync");
    return function(type, cancellable, error);
}

GDBusConnection* g_dbus_connection_new_for_address_sync(const gchar* address, GDBusConnectionFlags flags,
                                                        GDBusAuthObserver* observer,
                                                        GCancellable* cancellable, GError** error) {
    static auto* const function =
        find<decltype(g_dbus_connection_new_for_address_sync)>("g_dbus_connection_new_for_address_sync");
    return function(address, flags, observer, cancellable, error);
}

gboolean g_dbus_connection_is_closed(GDBusConnection* connection) {
    static auto* const function = find<decltype(g_dbus_connection_is_closed)>("g_dbus_connection_is_closed");
    return function(connection);
}

void g_dbus_connection_close(GDBusConnection* connection, GCancellable* cancellable,
                             GAsyncReadyCallback callback, gpointer data) {
    static auto* const function = find<decltype(g_dbus_connection_close)>("g_dbus_connection_close");
    function(connection, cancellable, callback, data);
}

gboolean g_dbus_connection_flush_sync(GDBusConnection* connection, GCancellable* cancellable,
                                      GError** error) {
    static auto* const function =
        find<decltype(g_dbus_connection_flush_sync)>("g_dbus_connection_flush_sync");
    return function(connection, cancellable, error);
}

GVariant* g_dbus_connection_call_sync(GDBusConnection* connection, const gchar* service, const gchar* path,
                                      const gchar* interface, const gchar* method, GVariant* arguments,
                                      const GVariantType* replyType, GDBusCallFlags flags, gint milliseconds,
                                      GCancellable* cancellable, GError** error) {
    static auto* const function = find<decltype(g_dbus_connection_call_sync)>("g_dbus_connection_call_sync");
    return function(connection, service, path, interface, method, arguments, replyType, flags, milliseconds,
                    cancellable, error);
}

gboolean g_dbus_connection_emit_signal(GDBusConnection* connection, const gchar* service, const gchar* path,
                                       const gchar* interface, const gchar* signal, GVariant* arguments,
                                       GError** error) {
    static auto* const function =
        find<decltype(g_dbus_connection_emit_signal)>("g_dbus_connection_emit_signal");
    return function(connection, service, path, interface, signal, arguments, error);
}

guint g_dbus_connection_signal_subscribe(GDBusConnection* connection, const gchar* sender,
                                         const gchar* interface, const gchar* member, const gchar* path,
                                         const gchar* firstArgument, GDBusSignalFlags flags,
                                         GDBusSignalCallback callback, gpointer data,
                                         GDestroyNotify destroy) {
    static auto* const function =
        find<decltype(g_dbus_connection_signal_subscribe)>("g_dbus_connection_signal_subscribe");
    return function(connection, sender, interface, member, path, firstArgument, flags, callback, data,
                    destroy);
}

void g_dbus_connection_signal_unsubscribe(GDBusConnection* connection, guint subscription) {
    static auto* const function =
        find<decltype(g_dbus_connection_signal_unsubscribe)>("g_dbus_connection_signal_unsubscribe");
    function(connection, subscription);
}

gboolean g_dbus_error_strip_remote_error(GError* error) {
    static auto* const function =
        find<decltype(g_dbus_error_strip_remote_error)>("g_dbus_error_strip_remote_error");
    return function(error);
}

gboolean g_dbus_is_interface_name(const gchar* text) {
    static auto* const function = find<decltype(g_dbus_is_interface_name)>("g_dbus_is_interface_name");
    return function(text);
}
