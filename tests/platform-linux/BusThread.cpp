#include "tests/platform-linux/BusThread.h"

#include <cstdlib>
#include <future>
#include <stdexcept>

namespace ventras {
namespace {

GObjectPtr<GDBusConnection> connect() {
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    GError* error = nullptr;
    GObjectPtr<GDBusConnection> connection{g_dbus_connection_new_for_address_sync(
        std::getenv("DBUS_SYSTEM_BUS_ADDRESS"), kFlags, nullptr, nullptr, &error)};
    const GErrorPtr owner{error};
    if (!connection)
        throw std::runtime_error(error->message);
    return connection;
}

}  // namespace

BusThread::BusThread(std::function<void(GDBusConnection*)> setUp)
    : context_(g_main_context_new()), loop_(g_main_loop_new(context_, FALSE)) {
    std::promise<void> ready;
    thread_ = std::thread([&ready, &setUp, this] {
        g_main_context_push_thread_default(context_);
        {
            const auto connection = connect();
            setUp(connection.get());
            ready.set_value();
            g_main_loop_run(loop_);
        }
        g_main_context_pop_thread_default(context_);
    });
    ready.get_future().get();
}

BusThread::~BusThread() {
    g_main_loop_quit(loop_);
    thread_.join();
    g_main_loop_unref(loop_);
    g_main_context_unref(context_);
}

void callBus(GDBusConnection* connection, const char* method, GVariant* arguments) {
    GError* error = nullptr;
    const VariantPtr reply{g_dbus_connection_call_sync(
        connection, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
        arguments, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error)};
    const GErrorPtr owner{error};
    if (!reply)
        throw std::runtime_error(error->message);
}

}  // namespace ventras
