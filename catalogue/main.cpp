#include <glib.h>

#include <charconv>
#include <optional>
#include <string_view>

#include "catalogue/AgentService.h"
#include "catalogue/ThisRelease.h"
#include "platform/linux/DataFolder.h"
#include "platform/linux/Syslog.h"

namespace {

using namespace ventras;

constexpr int kUsage = 2;
constexpr int kNoBus = 1;

// Several devices of a round ask one after the other.
constexpr std::chrono::milliseconds kIdleLimit{30'000};

/// The one argument, "--idle-limit=MILLISECONDS". @return absent when it is anything else.
std::optional<std::chrono::milliseconds> idleLimit(std::string_view argument) {
    constexpr std::string_view kOption = "--idle-limit=";
    if (!argument.starts_with(kOption))
        return std::nullopt;
    argument.remove_prefix(kOption.size());
    unsigned number = 0;
    const auto* end = argument.data() + argument.size();
    const auto read = std::from_chars(argument.data(), end, number);
    if (read.ec != std::errc{} || read.ptr != end)
        return std::nullopt;
    return std::chrono::milliseconds(number);
}

}  // namespace

int main(int argc, char** argv) {
    const auto limit = argc == 2 ? idleLimit(argv[1]) : kIdleLimit;
    if (argc > 2 || !limit) {
        g_printerr("Usage: ventras-catalogue-agent [--idle-limit=MILLISECONDS]\n");
        return kUsage;
    }
    Syslog log;
    CatalogueAgent agent(locateDataFolder() / DriverCatalogue::kFileName, thisRelease(), log);
    if (AgentService(agent).run(*limit))
        return 0;
    log.error("driver packages cannot be looked up: the session bus is not there, or is served already");
    return kNoBus;
}
