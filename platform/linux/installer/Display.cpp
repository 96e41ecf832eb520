#include "platform/linux/installer/Display.h"

#include <cstdlib>
#include <filesystem>
#include <string>
#include <system_error>

namespace ventras {
namespace {

namespace fs = std::filesystem;

std::string variable(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? "" : value;
}

bool isThere(const fs::path& path) {
    std::error_code error;
    return fs::exists(path, error);
}

bool isWaylandThere() {
    const auto display = variable("WAYLAND_DISPLAY");
    return !display.empty() && isThere(fs::path(variable("XDG_RUNTIME_DIR")) / display);
}

// ":1.0" is screen 0 of display 1 here; "host:1" is somewhere else, and "localhost:10" what ssh forwards.
bool isX11There() {
    const auto display = variable("DISPLAY");
    if (!display.starts_with(':'))
        return !display.empty();
    return isThere("/tmp/.X11-unix/X" + display.substr(1, display.find('.') - 1));
}

}  // namespace

bool isDisplayThere() {
    return isWaylandThere() || isX11There();
}

}  // namespace ventras
