#include "platform/linux/desktop/PolkitAuthorization.h"

#include <cups/cups.h>
#include <sys/stat.h>
#include <sysexits.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <optional>
#include <sstream>
#include <string>

#include "platform/FileContent.h"
#include "platform/linux/desktop/DBusCall.h"

namespace ventras {
namespace {

constexpr std::int32_t kGranted = 0;
constexpr std::int32_t kRefused = EX_NOPERM;

constexpr DBusMethod kCheckAuthorization{Bus::System, "org.freedesktop.PolicyKit1",
                                         "/org/freedesktop/PolicyKit1/Authority",
                                         "org.freedesktop.PolicyKit1.Authority", "CheckAuthorization"};
constexpr guint32 kAllowUserInteraction = 1;
constexpr auto kLimit = std::chrono::seconds(10);
constexpr auto kLimitForPeople = std::chrono::minutes(2);  // somebody has to find a password

bool isRoot() {
    return getuid() == 0 && geteuid() == 0;
}

// Start time in clock ticks since boot: field 22 of proc(5)'s stat. The command name, field 2, may hold
// anything.
std::uint64_t ownStartTime() {
    const auto line = fileContent("/proc/self/stat").value_or("");
    const auto nameEnd = line.rfind(')');
    if (nameEnd == std::string::npos)
        return 0;
    std::istringstream fields(line.substr(nameEnd + 1));
    constexpr int kFieldsBetween = 19;
    std::string skipped;
    for (int i = 0; i < kFieldsBetween; ++i)
        fields >> skipped;
    std::uint64_t startTime = 0;
    fields >> startTime;
    return startTime;
}

bool isSomebodyThere() {
    constexpr std::array kSessionVariables{"XDG_SESSION_ID", "WAYLAND_DISPLAY", "DISPLAY"};
    return std::ranges::any_of(kSessionVariables,
                               [](const char* name) { return std::getenv(name) != nullptr; });
}

GVariant* question(std::string_view right, bool interactive) {
    GVariantBuilder subject;
    g_variant_builder_init(&subject, G_VARIANT_TYPE_VARDICT);
    g_variant_builder_add(&subject, "{sv}", "pid", g_variant_new_uint32(static_cast<guint32>(getpid())));
    g_variant_builder_add(&subject, "{sv}", "start-time", g_variant_new_uint64(ownStartTime()));
    g_variant_builder_add(&subject, "{sv}", "uid", g_variant_new_int32(static_cast<gint32>(getuid())));
    const std::string action(right);
    return g_variant_new("((sa{sv})sa{ss}us)", "unix-process", &subject, action.c_str(), nullptr,
                         interactive ? kAllowUserInteraction : 0, "");
}

// Absent when polkit gives no answer, which includes an action that it does not know.
std::optional<bool> askPolkit(std::string_view right) {
    const bool interactive = isSomebodyThere();
    const auto answer = interactive
                            ? callDBus(kCheckAuthorization, question(right, true), "((bba{ss}))",
                                       kLimitForPeople, DBusCallMode::MayAskTheUser)
                            : callDBus(kCheckAuthorization, question(right, false), "((bba{ss}))", kLimit);
    if (!answer.reply)
        return std::nullopt;
    gboolean authorized = FALSE;
    g_variant_get(answer.reply.get(), "((bba{ss}))", &authorized, nullptr, nullptr);
    return authorized != FALSE;
}

bool ownsSchedulerSocket() {
    struct stat status {};
    const char* server = cupsServer();
    return server != nullptr && server[0] == '/' && stat(server, &status) == 0 && S_ISSOCK(status.st_mode) &&
           status.st_uid == getuid();
}

}  // namespace

std::int32_t PolkitAuthorization::create(std::string_view right) {
    if (isRoot())
        return kGranted;
    if (const auto granted = askPolkit(right))
        return *granted ? kGranted : kRefused;
    return ownsSchedulerSocket() ? kGranted : kRefused;
}

}  // namespace ventras
