#include <dlfcn.h>
#include <gtest/gtest.h>

#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/desktop/DBusConnection.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

constexpr DBusMethod kGetId{Bus::System, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                            "org.freedesktop.DBus", "GetId"};
constexpr DBusSignal kSignal{Bus::System, "/com/example", "com.example.Test", "Happened"};

DBusAnswer askBus(std::chrono::milliseconds limit = 5s) {
    return callDBus(kGetId, g_variant_new("()"), "(s)", limit);
}

bool isGioLoaded() {
    void* const library = dlopen("libgio-2.0.so.0", RTLD_LAZY | RTLD_NOLOAD);
    if (library != nullptr)
        dlclose(library);
    return library != nullptr;
}

TEST(GioOnDemand, IsLoadedWithTheFirstCall) {
    const PrivateBus bus;
    EXPECT_FALSE(isGioLoaded());
    const auto answer = askBus();
    EXPECT_TRUE(answer.reply) << answer.failure;
    EXPECT_TRUE(isGioLoaded());
}

TEST(GioOnDemand, SendsSignals) {
    const PrivateBus bus;
    EXPECT_EQ(emitDBusSignal(kSignal, g_variant_new("()"), 5s), "");
}

TEST(GioOnDemand, HearsSignals) {
    const PrivateBus bus;
    const DBusConnection connection(Bus::System, 5s);
    ASSERT_NE(connection.get(), nullptr) << connection.failure();
    EXPECT_FALSE(g_dbus_connection_is_closed(connection.get()));
    bool heard = false;
    const auto onSignal = [](GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                             GVariant*, gpointer flag) { *static_cast<bool*>(flag) = true; };
    const auto subscription = g_dbus_connection_signal_subscribe(
        connection.get(), nullptr, kSignal.interface, kSignal.name, kSignal.path, nullptr,
        G_DBUS_SIGNAL_FLAGS_NONE, onSignal, &heard, nullptr);
    ASSERT_EQ(emitDBusSignal(kSignal, g_variant_new("()"), 5s), "");
    for (const auto end = Deadline::after(5s); !heard && !end.passed();)
        g_main_context_iteration(nullptr, FALSE);
    EXPECT_TRUE(heard);
    g_dbus_connection_signal_unsubscribe(connection.get(), subscription);
}

TEST(GioOnDemand, EndsWaitsAtTheirLimit) {
    PrivateBus bus;
    bus.suspend();
    const auto begin = std::chrono::steady_clock::now();
    EXPECT_FALSE(askBus(300ms).reply);
    EXPECT_LT(std::chrono::steady_clock::now() - begin, 3s);
    bus.resume();
}

TEST(GioOnDemand, KnowsInterfaceNames) {
    EXPECT_NE(g_dbus_is_interface_name("com.example.Test"), FALSE);
    EXPECT_EQ(g_dbus_is_interface_name("none"), FALSE);
}

TEST(GioOnDemand, TakesTheNamesOfRemoteErrorsOff) {
    const PrivateBus bus;
    const auto answer = callDBus({Bus::System, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                  "org.freedesktop.DBus", "NoSuchMethod"},
                                 g_variant_new("()"), "()", 5s);
    EXPECT_FALSE(answer.reply);
    EXPECT_EQ(answer.failure.find("GDBus.Error"), std::string::npos) << answer.failure;
}

}  // namespace
}  // namespace ventras
