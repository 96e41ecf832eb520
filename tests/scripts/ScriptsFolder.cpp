#include "tests/scripts/ScriptsFolder.h"

#include <cstdlib>

namespace ventras {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

}  // namespace

ScriptsFolder::ScriptsFolder(std::optional<uid_t> user) : folder_(user) {
    fs::copy(VENTRAS_SCRIPTS, folder_ / "scripts", fs::copy_options::recursive);
    for (const char* name : {"build", "data"})
        fs::create_directories(folder_ / name);
    fs::copy(VENTRAS_REGISTER_DRIVERS, folder_ / "data");
    fs::create_symlink(VENTRAS_BUILD, folder_ / "build/release");
    for (const char* name : {"home", "commands"})
        fs::create_directories(folder_ / name);
    fs::permissions(home(), fs::perms{0777});
    for (const char* command : {"apt-get", "sudo"})
        replaceCommand(command, "echo 'tests install nothing' >&2; exit 99");
    replaceCommand("cmake", "exit 0");
    options_ = {.environment = {{"PATH", (folder_ / "commands").string() + ":" + std::getenv("PATH")},
                                {"HOME", home()},
                                {"XDG_STATE_HOME", home() / "state"},
                                {"XDG_CONFIG_HOME", home() / "config"},
                                {"CUPS_SERVER", home() / "no-scheduler"},
                                {"DBUS_SYSTEM_BUS_ADDRESS", "unix:path=" + (home() / "no-bus").string()}},
                .user = user};
}

void ScriptsFolder::replaceCommand(std::string_view name, std::string_view script) const {
    const auto file =
        folder_.write("commands/" + std::string(name), "#!/bin/sh\n" + std::string(script) + "\n");
    fs::permissions(file, fs::perms{0755});
}

ProgramResult ScriptsFolder::run(std::string_view script, const std::vector<std::string>& arguments) const {
    std::vector<std::string> command{"bash", folder_ / script};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return runProgram(command, options_, 90s);
}

ProgramResult ScriptsFolder::runWithParts(std::string_view code) const {
    const auto script = "set -euo pipefail; source_dir='" + folder_.path().string() +
                        "'; for part in \"$source_dir\"/scripts/lib/*.sh; do . \"$part\"; done; " +
                        std::string(code);
    return runProgram({"bash", "-c", script}, options_, 90s);
}

}  // namespace ventras
