#pragma once

#include <set>
#include <string>
#include <string_view>

namespace ventras {

class PreferenceStore;
class VentrasPrinterObject;

/// Remembers, for one run, the devices already considered for a driver download, and writes them to the
/// user's preferences, which are never read back. Main thread only.
class SeenPrinters {
public:
    static constexpr std::string_view kDomain = "com.quillon.print.ventrasagent";
    static constexpr std::string_view kKey = "Printers Seen";

    explicit SeenPrinters(PreferenceStore& preferences) : preferences_(preferences) {}

    /// Whether the device was recorded; a device without a scan ID counts as seen.
    bool contains(VentrasPrinterObject& printer) const;

    /// Records the device's scan ID and stores the whole memory. A device without one changes nothing.
    void insert(VentrasPrinterObject& printer);

private:
    PreferenceStore& preferences_;
    std::set<std::string, std::less<>> scanIDs_;
};

}  // namespace ventras
