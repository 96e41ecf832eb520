#include "catalogue/AgentService.h"

#include <string>

#include "platform/Deadline.h"
#include "platform/PrintToolAgentChannel.h"
#include "platform/linux/desktop/DBusConnection.h"
#include "platform/linux/desktop/PropertyVariant.h"

namespace ventras {
namespace {

constexpr const char* kName = PrintToolAgentChannel::kService.data();
constexpr const char* kPath = "/com/quillon/lorvextool/agent";
constexpr const char* kInterface =
    "<node><interface name='com.quillon.lorvextool.agent'><method name='Command'>"
    "<arg name='command' type='u' direction='in'/>"
    "<arg name='arguments' type='a{sv}' direction='in'/>"
    "<arg name='reply' type='a{sv}' direction='out'/>"
    "</method></interface></node>";

constexpr std::chrono::seconds kBusLimit{10};
constexpr guint32 kDoNotQueue = 4;
constexpr guint32 kIsOwner = 1;

using NodeInfoPtr =
    std::unique_ptr<GDBusNodeInfo, decltype([](GDBusNodeInfo* node) { g_dbus_node_info_unref(node); })>;

/// What the callbacks share.
struct Serving {
    CatalogueAgent& agent;
    std::chrono::milliseconds idleLimit;
    Deadline idle;
    bool busIsGone = false;
};

void onCommand(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*, GVariant* arguments,
               GDBusMethodInvocation* invocation, gpointer data) {
    auto& serving = *static_cast<Serving*>(data);
    serving.idle = Deadline::after(serving.idleLimit);
    guint32 command = 0;
    GVariant* dictionary = nullptr;
    g_variant_get(arguments, "(u@a{sv})", &command, &dictionary);
    const VariantPtr owner{dictionary};
    if (const auto reply = serving.agent.answer(command, dictionaryFromVariant(dictionary)))
        g_dbus_method_invocation_return_value(invocation,
                                              g_variant_new("(@a{sv})", variantFromDictionary(*reply)));
    else
        g_dbus_method_invocation_return_error_literal(invocation, G_DBUS_ERROR, G_DBUS_ERROR_INVALID_ARGS,
                                                      "no command, or not its arguments");
}

void onClosed(GDBusConnection*, gboolean, GError*, gpointer data) {
    static_cast<Serving*>(data)->busIsGone = true;
}

gboolean onTick(gpointer) {
    return G_SOURCE_CONTINUE;  // lets the main loop look at the clock
}

constexpr GDBusInterfaceVTable kMembers{onCommand, nullptr, nullptr, {}};

/// A method of the bus about our name. @return its answer, 0 when there is none.
guint32 askBus(const DBusConnection& bus, const char* method, GVariant* arguments) {
    const auto answer = bus.call(
        {Bus::Session, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method},
        arguments, "(u)", kBusLimit);
    guint32 number = 0;
    if (answer.reply)
        g_variant_get(answer.reply.get(), "(u)", &number);
    return number;
}

bool offer(const DBusConnection& bus, Serving& serving) {
    const NodeInfoPtr node{g_dbus_node_info_new_for_xml(kInterface, nullptr)};
    return g_dbus_connection_register_object(bus.get(), kPath, node->interfaces[0], &kMembers, &serving,
                                             nullptr, nullptr) != 0 &&
           askBus(bus, "RequestName", g_variant_new("(su)", kName, kDoNotQueue)) == kIsOwner;
}

}  // namespace

bool AgentService::run(std::chrono::milliseconds idleLimit) {
    Serving serving{agent_, idleLimit, Deadline::after(idleLimit)};
    const DBusConnection bus(Bus::Session, kBusLimit);
    if (bus.get() == nullptr)
        return false;
    g_signal_connect(bus.get(), "closed", G_CALLBACK(onClosed), &serving);
    if (!offer(bus, serving))
        return false;
    const auto tick = g_timeout_add(100, onTick, nullptr);
    while (!serving.busIsGone && !serving.idle.passed())
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(tick);

    // Whoever asks from here on is answered by a new process; who has asked already, by this one.
    if (!serving.busIsGone)
        askBus(bus, "ReleaseName", g_variant_new("(s)", kName));
    while (g_main_context_iteration(nullptr, FALSE) != FALSE) {
    }
    const CancelAtDeadline cancel(Deadline::after(kBusLimit));
    g_dbus_connection_flush_sync(bus.get(), cancel.get(), nullptr);
    return true;
}

}  // namespace ventras
