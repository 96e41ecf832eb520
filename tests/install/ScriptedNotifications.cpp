#include "tests/install/ScriptedNotifications.h"

#include <utility>

namespace ventras {
namespace {

constexpr const char* kService = "org.freedesktop.Notifications";
constexpr const char* kPath = "/org/freedesktop/Notifications";
constexpr const char* kMembers =
    "<method name='GetCapabilities'><arg type='as' direction='out'/></method>"
    "<method name='Notify'><arg type='s' direction='in'/><arg type='u' direction='in'/>"
    "<arg type='s' direction='in'/><arg type='s' direction='in'/><arg type='s' direction='in'/>"
    "<arg type='as' direction='in'/><arg type='a{sv}' direction='in'/><arg type='i' direction='in'/>"
    "<arg type='u' direction='out'/></method>"
    "<method name='CloseNotification'><arg type='u' direction='in'/></method>";
constexpr unsigned kClosedByCall = 3;

}  // namespace

ScriptedNotifications::ScriptedNotifications(Reaction reaction, std::vector<std::string> capabilities)
    : reaction_(std::move(reaction)),
      thread_([&](GDBusConnection* connection) { offer(connection, capabilities); }) {}

void ScriptedNotifications::offer(GDBusConnection* connection, const std::vector<std::string>& capabilities) {
    connection_ = connection;
    service_ = std::make_unique<BusObject>(
        connection, kPath, kService, kMembers,
        [this, capabilities](const std::string& method, GVariant* arguments, GDBusMethodInvocation* call) {
            std::vector<const char*> names;
            for (const auto& capability : capabilities)
                names.push_back(capability.c_str());
            if (method == "GetCapabilities")
                return g_dbus_method_invocation_return_value(
                    call, g_variant_new("(@as)",
                                        g_variant_new_strv(names.data(), static_cast<gssize>(names.size()))));
            if (method == "CloseNotification") {
                unsigned id = 0;
                g_variant_get(arguments, "(u)", &id);
                takeAway(id);
                g_dbus_method_invocation_return_value(call, nullptr);
                return close(id, kClosedByCall);
            }
            const auto notification = note(arguments);
            g_dbus_method_invocation_return_value(call, g_variant_new("(u)", notification.id));
            if (!notification.buttons.empty() && reaction_)
                reaction_(*this, notification.id);
        });
    callBus(connection, "RequestName", g_variant_new("(su)", kService, 0U));
}

ShownNotification ScriptedNotifications::note(GVariant* arguments) {
    ShownNotification notification;
    const char *icon = nullptr, *title = nullptr, *body = nullptr;
    GVariant *actions = nullptr, *hints = nullptr;
    g_variant_get(arguments, "(&su&s&s&s@as@a{sv}i)", nullptr, &notification.replaces, &icon, &title, &body,
                  &actions, &hints, &notification.timeLimit);
    const VariantPtr actionsOwner{actions};
    const VariantPtr hintsOwner{hints};
    notification.icon = icon;
    notification.title = title;
    notification.body = body;
    for (gsize i = 0; i + 1 < g_variant_n_children(actions); i += 2) {
        const char *key = nullptr, *text = nullptr;
        g_variant_get_child(actions, i, "&s", &key);
        g_variant_get_child(actions, i + 1, "&s", &text);
        notification.buttons.emplace(key, text);
    }
    notification.hints = GTextPtr(g_variant_print(hints, FALSE)).get();
    const std::lock_guard lock(mutex_);
    notification.id = notification.replaces != 0 ? notification.replaces : ++lastID_;
    shown_.push_back(notification);
    return notification;
}

void ScriptedNotifications::takeAway(unsigned id) {
    const std::lock_guard lock(mutex_);
    takenAway_.push_back(id);
}

void ScriptedNotifications::press(unsigned id, const std::string& button) {
    service_->emit("ActionInvoked", g_variant_new("(us)", id, button.c_str()));
}

void ScriptedNotifications::close(unsigned id, unsigned reason) {
    service_->emit("NotificationClosed", g_variant_new("(uu)", id, reason));
}

void ScriptedNotifications::goAway() {
    callBus(connection_, "ReleaseName", g_variant_new("(s)", kService));
}

ScriptedNotifications::Reaction ScriptedNotifications::pressing(const std::string& button) {
    return [button](ScriptedNotifications& service, unsigned id) { service.press(id, button); };
}

std::vector<ShownNotification> ScriptedNotifications::shown() {
    const std::lock_guard lock(mutex_);
    return shown_;
}

std::vector<unsigned> ScriptedNotifications::takenAway() {
    const std::lock_guard lock(mutex_);
    return takenAway_;
}

}  // namespace ventras
