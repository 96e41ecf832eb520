#include "tests/platform-linux/PostedNotifications.h"

#include <chrono>

namespace ventras {

std::vector<std::string> PostedNotifications::heard(std::size_t count) {
    using namespace std::chrono_literals;
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, 5s, [&] { return heard_.size() >= count; });
    return heard_;
}

void PostedNotifications::listen(GDBusConnection* connection) {
    g_dbus_connection_signal_subscribe(connection, nullptr, "com.quillon.print.Notifications", "Posted",
                                       "/com/quillon/print/Notifications", nullptr, G_DBUS_SIGNAL_FLAGS_NONE,
                                       onSignal, this, nullptr);
    callBus(connection, "GetId", nullptr);  // by its answer the bus knows of the subscription
}

void PostedNotifications::onSignal(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                                   GVariant* parameters, gpointer self) {
    auto& listener = *static_cast<PostedNotifications*>(self);
    const GTextPtr text{g_variant_print(parameters, TRUE)};
    const std::lock_guard lock(listener.mutex_);
    listener.heard_.emplace_back(text.get());
    listener.changed_.notify_all();
}

}  // namespace ventras
