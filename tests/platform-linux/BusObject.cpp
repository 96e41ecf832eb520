#include "tests/platform-linux/BusObject.h"

#include <memory>
#include <stdexcept>
#include <utility>

namespace ventras {

BusObject::BusObject(GDBusConnection* connection, std::string path, std::string interface,
                     const std::string& members, Calls calls, Properties properties)
    : connection_(connection),
      path_(std::move(path)),
      interface_(std::move(interface)),
      calls_(std::move(calls)),
      properties_(std::move(properties)) {
    static constexpr GDBusInterfaceVTable kHandlers{
        [](GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar* method,
           GVariant* arguments, GDBusMethodInvocation* invocation,
           gpointer self) { static_cast<BusObject*>(self)->calls_(method, arguments, invocation); },
        [](GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar* property, GError**,
           gpointer self) { return static_cast<BusObject*>(self)->properties_(property); },
        nullptr,
        {}};
    const auto xml = "<node><interface name='" + interface_ + "'>" + members + "</interface></node>";
    const std::unique_ptr<GDBusNodeInfo, decltype(&g_dbus_node_info_unref)> node{
        g_dbus_node_info_new_for_xml(xml.c_str(), nullptr), &g_dbus_node_info_unref};
    if (!node || g_dbus_connection_register_object(connection, path_.c_str(), node->interfaces[0], &kHandlers,
                                                   this, nullptr, nullptr) == 0)
        throw std::runtime_error("cannot offer " + xml);
}

void BusObject::emit(const char* signal, GVariant* arguments) const {
    g_dbus_connection_emit_signal(connection_, nullptr, path_.c_str(), interface_.c_str(), signal, arguments,
                                  nullptr);
}

void BusObject::emitChanged(const char* property, GVariant* value) const {
    GVariantBuilder changed;
    g_variant_builder_init(&changed, G_VARIANT_TYPE_VARDICT);
    g_variant_builder_add(&changed, "{sv}", property, value);
    g_dbus_connection_emit_signal(
        connection_, nullptr, path_.c_str(), "org.freedesktop.DBus.Properties", "PropertiesChanged",
        g_variant_new("(sa{sv}as)", interface_.c_str(), &changed, nullptr), nullptr);
}

void later(unsigned milliseconds, std::function<void()> function) {
    const auto run = [](gpointer data) -> gboolean {
        (*static_cast<std::function<void()>*>(data))();
        return G_SOURCE_REMOVE;
    };
    const auto release = [](gpointer data) {
        const std::unique_ptr<std::function<void()>> owner{static_cast<std::function<void()>*>(data)};
    };
    GSource* source = g_timeout_source_new(milliseconds);
    g_source_set_callback(source, run, std::make_unique<std::function<void()>>(std::move(function)).release(),
                          release);
    g_source_attach(source, g_main_context_get_thread_default());
    g_source_unref(source);
}

}  // namespace ventras
