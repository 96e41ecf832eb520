#include "platform/linux/desktop/DBusPrintToolAgentChannel.h"

#include <sysexits.h>

#include <algorithm>
#include <string>

#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/desktop/PropertyVariant.h"

namespace ventras {
namespace {

constexpr std::int32_t kNoService = EX_UNAVAILABLE;
constexpr auto kLimit = std::chrono::seconds(10);

}  // namespace

PrintToolAgentReply DBusPrintToolAgentChannel::sendCommandSync(std::string_view service, std::int32_t command,
                                                               const PropertyDictionary& arguments) {
    const std::string name(service);
    std::string path = "/" + name;
    std::ranges::replace(path, '.', '/');
    if (g_dbus_is_interface_name(name.c_str()) == FALSE || g_variant_is_object_path(path.c_str()) == FALSE)
        return {kNoService, {}};

    const DBusMethod method{Bus::Session, name.c_str(), path.c_str(), name.c_str(), "Command"};
    const auto answer = callDBus(
        method, g_variant_new("(u@a{sv})", static_cast<guint32>(command), variantFromDictionary(arguments)),
        "(a{sv})", kLimit);
    if (!answer.reply)
        return {kNoService, {}};
    const VariantPtr dictionary{g_variant_get_child_value(answer.reply.get(), 0)};
    return {0, dictionaryFromVariant(dictionary.get())};
}

}  // namespace ventras
