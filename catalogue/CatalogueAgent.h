#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

#include "catalogue/DriverCatalogue.h"
#include "platform/PropertyValue.h"

namespace ventras {

class Log;

/// Answers the printing user-interface tool's agent's commands from a catalogue file, which is read at the
/// first one. One thread at a time.
class CatalogueAgent {
public:
    /// @param file the catalogue; when it cannot be used, no package is known of, and the log says why
    /// @param thisRelease of the system that runs this, such as "debian 12"
    CatalogueAgent(std::filesystem::path file, std::string thisRelease, Log& log);

    /// Command 1 counts the best packages for the device ID under "scanID"; where "Vellum" is true, those
    /// with drivers for driverless printing count, too.
    /// @return "count"; "is_cache_current", whether the catalogue is there and made for this release; and,
    ///         when several packages are equally good, their names under "conflicts". Absent when the command
    ///         or its arguments make no sense.
    std::optional<PropertyDictionary> answer(std::uint32_t command, const PropertyDictionary& arguments);

private:
    const DriverCatalogue* catalogue();

    std::filesystem::path file_;
    std::string thisRelease_;
    Log& log_;
    std::optional<CatalogueReading> reading_;
};

}  // namespace ventras
