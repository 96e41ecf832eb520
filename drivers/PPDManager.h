#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "drivers/GenericDrivers.h"
#include "drivers/PPDRecord.h"
#include "drivers/TextEncoding.h"
#include "platform/Handles.h"

namespace ventras {

struct Platform;

/// Knows the drivers: reads and ranks PPDs, asks the local scheduler for its catalogue, finds the drivers
/// that fit a device, and holds the generic ones. Each of these has its own file; this is their one face. Any
/// thread may call.
class PPDManager {
public:
    using Records = std::vector<PPDRecord>;

    explicit PPDManager(Platform& platform);

    /// The process's shared manager, made at the first call and kept; later calls give the same one.
    static PPDManager& defaultManager(Platform& platform);

    // PPD files and records (Adobe PPD 4.3)

    /// Reads a PPD file, compressed or not. @return absent when libcups cannot open it as a PPD.
    static std::optional<PPDRecord> parsePPD(const std::string& path);

    /// How good a kind of driver the record is, 0 (best) to 10; absent record = 10.
    static unsigned ppdKind(const std::optional<PPDRecord>& record);
    static unsigned ppdKind(const PPDRecord& record);

    /// Whether the file's first line begins as a PPD's does.
    static bool isPPDFile(const std::string& path);

    /// True, always; the file is not looked at.
    static bool isValidPPD(const std::string& path);

    static bool isFaxPPD(const PPDRecord& record);
    static bool isPostscriptPPD(const PPDRecord& record);
    static bool isRasterPPD(const PPDRecord& record);

    /// The encoding that an open PPD names; null gives UTF-8.
    static TextEncoding stringEncoding(ppd_file_t* ppd);

    /// A copy of its argument.
    static std::string localizedPPD(const std::string& ppd);

    // The scheduler's catalogue

    /// The catalogue, asked for anew, in the scheduler's order; empty when it does not answer.
    Records ppds() const;

    /// Copies a local PPD, decompressed. @return path of a new temporary file that the caller deletes, or
    /// absent.
    std::optional<std::string> ppdFileWithName(const std::optional<std::string>& path) const;

    /// Fetches a driver's PPD. @return path of a new temporary file that the caller deletes, or absent.
    std::optional<std::string> ppdFile(const PPDRecord& record) const;

    // Drivers for a device

    using Text = std::optional<std::string>;

    /// The records that fit, best first. Without a list the whole catalogue is asked for.
    Records matchPPDsByDeviceID(const Text& deviceID, const Text& model, const Text& product) const;
    static Records matchPPDsByDeviceID(const Text& deviceID, const Text& model, const Text& product,
                                       const Records& list);
    Records matchPPDsByProduct(const Text& product) const;
    static Records matchPPDsByProduct(const Text& product, const Records& list);
    Records matchPPDsByModel(const Text& model) const;
    static Records matchPPDsByModel(const Text& model, const Records& list);

    /// Nothing, for every type.
    std::optional<Records> ppdsOfType(std::string_view type) const;
    std::optional<Records> faxPPDs() const;
    std::optional<Records> rasterPPDs() const;
    std::optional<Records> postscriptPPDs() const;

    // Generic drivers

    /// Copies of the generic records, each looked up once in this manager's life.
    PPDRecord genericPostscriptPPD();
    PPDRecord genericPCLPPD();
    PPDRecord genericFaxPPD();
    PPDRecord genericURFPPD();

    /// Reads a generic PPD from the print system's resources.
    /// @throws InternalInconsistencyError when it is missing or does not parse: a broken installation.
    PPDRecord genericSystemPPD(std::string_view name) const;

    // Drivers that could be installed

    /// The one driver package for a device; absent when there is none, or more than one.
    std::optional<PPDRecord> softwareUpdateDriverFor(const Text& deviceID, bool vellum) const;
    std::optional<PPDRecord> softwareUpdateForPPD(ppd_file_t* ppd) const;

private:
    Platform& platform_;
    GenericDrivers generics_;
};

}  // namespace ventras
