#pragma once

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <map>
#include <optional>
#include <string>

namespace ventras {

/// Who may do what with a private scheduler.
enum class SchedulerPolicy {
    open,   ///< everybody on this machine may administer it, without a password
    stock,  ///< as distributions ship it: administrators only, proven by password or by the socket's peer
    refusesAdditions,  ///< like open, but nobody may add or modify a queue
};

/// What a private scheduler is to be like.
struct SchedulerOptions {
    SchedulerPolicy policy = SchedulerPolicy::open;
    bool listensOnTcp = false;  ///< on loopback, and clients are then sent there instead of to the socket
    std::optional<uid_t> user = {};  ///< runs as this user; absent: as the user of the test

    /// Backends besides the usual ones: URI scheme to shell script.
    std::map<std::string, std::string> backends = {};

    /// The whole catalogue of drivers: file name to PPD. Absent: the system's own.
    std::optional<std::map<std::string, std::string>> models = {};

    /// Printer definitions, as `printers.conf` holds them, that are there from the start.
    std::string printers = {};

    std::string errorPolicy = "stop-printer";
};

/// An ordinary user's id, for schedulers and programs of tests that run as root: "nobody". As another user it
/// is absent, so that the same test runs everything as that user.
std::optional<uid_t> ordinaryUser();

/// Fills a folder with everything that a scheduler of its own needs: configuration, spool, backends, drivers.
/// @param socket path of the UNIX socket to listen on
/// @param port TCP port on loopback; 0 = none
void furnishSchedulerFolder(const std::filesystem::path& folder, const SchedulerOptions& options,
                            const std::filesystem::path& socket, std::uint16_t port);

}  // namespace ventras
