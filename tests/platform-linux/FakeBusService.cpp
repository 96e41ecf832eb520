#include "tests/platform-linux/FakeBusService.h"

#include <utility>

namespace ventras {

FakeBusService::FakeBusService(const std::string& name, const std::string& path, const std::string& interface,
                               const std::string& members, Handler handler)
    : handler_(std::move(handler)), thread_([&](GDBusConnection* connection) {
          object_.emplace(
              connection, path, interface, members,
              [this](const std::string& method, GVariant* arguments, GDBusMethodInvocation* invocation) {
                  if (GVariant* reply = handler_(method, arguments))
                      g_dbus_method_invocation_return_value(invocation, reply);
                  else
                      g_object_unref(invocation);
              },
              [this](const std::string& property) { return handler_(property, nullptr); });
          callBus(connection, "RequestName", g_variant_new("(su)", name.c_str(), 0U));
      }) {}

}  // namespace ventras
