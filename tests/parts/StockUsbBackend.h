#pragma once

#include <filesystem>
#include <fstream>

#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/Program.h"

namespace ventras {

/// The scheduler's own backend for USB printers, which makes way where the agent is installed.
inline std::filesystem::path stockUsbBackend() {
    const std::filesystem::path kept = "/usr/lib/cups/daemon/stock-usb";
    return std::filesystem::exists(kept) ? kept : "/usr/lib/cups/backend/usb";
}

/// Puts a copy of it somewhere, for nobody but root may run the original.
inline void copyStockUsbBackend(const std::filesystem::path& copy) {
    std::filesystem::create_directories(copy.parent_path());
    std::filesystem::copy_file(stockUsbBackend(), copy, std::filesystem::copy_options::overwrite_existing);
    std::filesystem::permissions(copy, std::filesystem::perms{0700});
}

/// Replaces a scheduler's backend that lays jobs down by the system's own, with the agent's in front of it. A
/// backend that is closed to others is run as root.
/// @param front the agent's backend
/// @param environment what the two need to see the USB
inline void useStockUsbBackend(const PrivateScheduler& scheduler, const std::filesystem::path& front,
                               const Environment& environment = {}) {
    const auto backend = scheduler.folder() / "bin/backend/usb";
    const auto programs = scheduler.folder() / "stock";
    copyStockUsbBackend(programs / "daemon/stock-usb");
    std::ofstream script(backend);
    script << "#!/bin/sh\n";
    for (const auto& [name, value] : environment)
        script << "export " << name << "='" << value << "'\n";
    script << "export CUPS_SERVERBIN=" << programs << "\nexec " << front << " \"$@\"\n";
    std::filesystem::permissions(backend, std::filesystem::perms{0700});
}

}  // namespace ventras
