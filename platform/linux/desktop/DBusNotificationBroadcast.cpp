#include "platform/linux/desktop/DBusNotificationBroadcast.h"

#include <string>

#include "platform/Log.h"
#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/desktop/PropertyVariant.h"

namespace ventras {
namespace {

constexpr DBusSignal kPosted{Bus::System, "/com/quillon/print/Notifications",
                             "com.quillon.print.Notifications", "Posted"};
constexpr auto kLimit = std::chrono::seconds(2);

}  // namespace

void DBusNotificationBroadcast::post(std::string_view name, const PropertyDictionary& userInfo) {
    const std::string text(name);
    const auto failure = emitDBusSignal(
        kPosted, g_variant_new("(s@a{sv})", text.c_str(), variantFromDictionary(userInfo)), kLimit);
    if (!failure.empty())
        log_.error("notification \"" + text + "\" is not posted: " + failure);
}

}  // namespace ventras
