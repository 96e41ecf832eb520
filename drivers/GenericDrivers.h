#pragma once

#include <functional>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <string_view>
#include <vector>

#include "drivers/PPDRecord.h"

namespace ventras {

class ResourceBundle;

/// A generic driver that the print system should hold is missing or broken; nothing catches it.
class InternalInconsistencyError : public std::logic_error {
public:
    using std::logic_error::logic_error;
};

/// The drivers for devices that no driver knows. Each is looked up once and then stays as it was found, even
/// if that was nothing. Any thread may ask; two that ask for the same driver first wait for one lookup.
class GenericDrivers {
public:
    using Catalogue = std::function<std::vector<PPDRecord>()>;

    /// @param resources holds the generic PPDs; outlives this object
    /// @param catalogue the scheduler's drivers, asked for when needed
    GenericDrivers(const ResourceBundle& resources, Catalogue catalogue);

    /// From the scheduler; else the print system's own.
    PPDRecord postscript();

    /// From the scheduler; else an empty record.
    PPDRecord pcl();

    PPDRecord fax();

    /// The driverless one.
    PPDRecord urf();

    /// Reads a generic PPD of the print system.
    /// @throws InternalInconsistencyError when it is missing or does not parse: a broken installation.
    PPDRecord system(std::string_view name) const;

private:
    struct Slot {
        std::mutex mutex;
        std::optional<PPDRecord> record;
    };
    template <typename Find>
    static PPDRecord once(Slot& slot, Find find);
    std::optional<PPDRecord> inCatalogue(std::string_view name) const;

    const ResourceBundle& resources_;
    Catalogue catalogue_;
    Slot postscript_, pcl_, fax_, urf_;
};

}  // namespace ventras
