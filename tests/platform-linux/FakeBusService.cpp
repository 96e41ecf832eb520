#include "tests/platform-linux/FakeBusService.h"

#include <memory>
#include <stdexcept>

namespace ventras {
namespace {

void onCall(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar* method,
            GVariant* arguments, GDBusMethodInvocation* invocation, gpointer handler) {
    if (GVariant* reply = (*static_cast<FakeBusService::Handler*>(handler))(method, arguments))
        g_dbus_method_invocation_return_value(invocation, reply);
    else
        g_object_unref(invocation);
}

GVariant* onGet(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar* property, GError**,
                gpointer handler) {
    return (*static_cast<FakeBusService::Handler*>(handler))(property, nullptr);
}

constexpr GDBusInterfaceVTable kMembers{onCall, onGet, nullptr, {}};

void offer(GDBusConnection* connection, const std::string& path, const std::string& interface,
           const std::string& members, FakeBusService::Handler& handler) {
    const auto xml = "<node><interface name='" + interface + "'>" + members + "</interface></node>";
    const std::unique_ptr<GDBusNodeInfo, decltype(&g_dbus_node_info_unref)> node{
        g_dbus_node_info_new_for_xml(xml.c_str(), nullptr), &g_dbus_node_info_unref};
    if (!node || g_dbus_connection_register_object(connection, path.c_str(), node->interfaces[0], &kMembers,
                                                   &handler, nullptr, nullptr) == 0)
        throw std::runtime_error("cannot offer " + xml);
}

}  // namespace

FakeBusService::FakeBusService(const std::string& name, const std::string& path, const std::string& interface,
                               const std::string& members, Handler handler)
    : handler_(std::move(handler)), thread_([&](GDBusConnection* connection) {
          offer(connection, path, interface, members, handler_);
          callBus(connection, "RequestName", g_variant_new("(su)", name.c_str(), 0U));
      }) {}

}  // namespace ventras
