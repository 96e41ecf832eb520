#include "platform/linux/installer/DBusSubscription.h"

#include <utility>

namespace ventras {
namespace {

constexpr const char* kBusName = "org.freedesktop.DBus";
constexpr const char* kBusPath = "/org/freedesktop/DBus";
constexpr auto kLimit = std::chrono::seconds(5);

void deliver(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar* member,
             GVariant* arguments, gpointer handler) {
    (*static_cast<DBusSubscription::Handler*>(handler))(member, arguments);
}

std::string ownerOf(const DBusConnection& connection, const char* service) {
    constexpr DBusMethod kGetNameOwner{Bus::System, kBusName, kBusPath, kBusName, "GetNameOwner"};
    const auto answer = connection.call(kGetNameOwner, g_variant_new("(s)", service), "(s)", kLimit);
    if (!answer.reply)
        return {};
    const char* owner = nullptr;
    g_variant_get(answer.reply.get(), "(&s)", &owner);
    return owner;
}

}  // namespace

DBusSubscription::DBusSubscription(const DBusConnection& connection, const std::string& sender,
                                   const char* interface, const std::string& path, Handler handler,
                                   const char* firstArgument)
    : handler_(std::move(handler)),
      connection_(connection.get()),
      id_(g_dbus_connection_signal_subscribe(connection_, sender.c_str(), interface, nullptr, path.c_str(),
                                             firstArgument, G_DBUS_SIGNAL_FLAGS_NONE, deliver, &handler_,
                                             nullptr)) {}

DBusSubscription::~DBusSubscription() {
    g_dbus_connection_signal_unsubscribe(connection_, id_);
}

DBusService::DBusService(const DBusConnection& connection, const char* service)
    : connection_(connection),
      changes_(
          connection, kBusName, kBusName, kBusPath,
          [this](std::string_view member, GVariant*) { hasChanged_ |= member == "NameOwnerChanged"; },
          service),
      owner_(ownerOf(connection, service)) {}

bool DBusService::isLost() const {
    return hasChanged_ || owner_.empty() || g_dbus_connection_is_closed(connection_.get()) != FALSE;
}

}  // namespace ventras
