// Starts the agent for each printer that the daemon for IPP over USB registers:
// ventrasagent-ippusb PROGRAM [ARGUMENT...] runs PROGRAM ARGUMENT... ippusb://NAME. It ends when DNS-SD does,
// for the service manager to start it anew.

#include <spawn.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "data/ippusb/PrinterWatch.h"
#include "platform/linux/ArgumentPointers.h"

namespace {

void start(std::vector<std::string> command, const std::string& printer) {
    command.push_back("ippusb://" + printer);
    const auto pointers = ventras::argumentPointers(command);

    sigset_t ignored;
    sigemptyset(&ignored);
    sigaddset(&ignored, SIGCHLD);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    posix_spawnattr_setsigdefault(&attributes, &ignored);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGDEF);
    if (const int error =
            posix_spawn(nullptr, pointers.front(), nullptr, &attributes, pointers.data(), environ);
        error != 0)
        std::fprintf(stderr, "%s: %s\n", pointers.front(), std::strerror(error));
    posix_spawnattr_destroy(&attributes);
}

}  // namespace

int main(int argc, char* argv[]) {
    if (argc < 2) {
        std::fprintf(stderr, "Usage: %s PROGRAM [ARGUMENT...]\n", argv[0]);
        return 2;
    }
    std::signal(SIGCHLD, SIG_IGN);  // nobody waits for the agents
    const std::vector<std::string> command(argv + 1, argv + argc);
    ventras::PrinterWatch watch([&](const std::string& printer) { start(command, printer); });
    std::fprintf(stderr, "No longer watching for printers: %s\n", watch.run().c_str());
    return 1;
}
