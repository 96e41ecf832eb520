#include <sys/mman.h>
#include <unistd.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "drivers/PPDKind.h"
#include "drivers/PPDMatching.h"
#include "drivers/PPDParser.h"
#include "drivers/SoftwareUpdateDrivers.h"
#include "platform/PrintToolAgentChannel.h"
#include "platform/Utf8.h"

// A PPD comes out of a driver package, or over the network out of a printer. Each input is read as a PPD
// file; what comes of it goes the way that a driver's record goes, and the few things that hold for any file
// are checked.

namespace {

using namespace ventras;

void require(bool holds) {
    if (!holds)
        std::abort();
}

/// A file in memory that libcups can open by name.
class MemoryFile {
public:
    MemoryFile() : descriptor_(memfd_create("ppd", MFD_CLOEXEC)) { require(descriptor_ >= 0); }
    ~MemoryFile() { close(descriptor_); }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    void hold(const std::uint8_t* data, std::size_t size) const {
        require(ftruncate(descriptor_, 0) == 0);
        require(pwrite(descriptor_, data, size, 0) == static_cast<ssize_t>(size));
    }

    std::string path() const { return "/proc/self/fd/" + std::to_string(descriptor_); }

private:
    int descriptor_;
};

/// Knows no driver for any device.
class NoAgent final : public PrintToolAgentChannel {
public:
    PrintToolAgentReply sendCommandSync(std::string_view, std::int32_t,
                                        const PropertyDictionary& arguments) override {
        require(isValidUtf8(*findText(arguments, "scanID")));
        return {1, {}};
    }
};

void followRecord(const PPDRecord& record) {
    require(record.make && record.makeAndModel && record.deviceID);
    for (const auto& product : record.product)
        require(isValidUtf8(product));
    require(recordFromDictionary(dictionaryFromRecord(record)) == record);

    const auto kind = PPDKind::of(record);
    require(kind == PPDKind::kInstalledLocalized || kind == PPDKind::kInstalled || kind == PPDKind::kTioga);

    // A device that says what a driver says is served by it.
    for (const auto& product : record.product)
        require(product.empty() || DeviceToMatch({}, {}, product).match(record));
    const std::array list{record};
    matchingDrivers(DeviceToMatch(record.deviceID, record.makeAndModel, record.make), list);
}

}  // namespace

// libcups itself loses the earlier values of a keyword that is repeated, e.g. `LanguageEncoding`.
extern "C" const char* __lsan_default_suppressions() {
    return "leak:_ppdOpen";
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const MemoryFile file;
    file.hold(data, size);
    beginsAsPPD(file.path());
    const auto record = parsePPDFile(file.path());
    if (!record)
        return 0;

    followRecord(*record);
    NoAgent agent;
    const PpdPtr ppd{ppdOpenFile(file.path().c_str())};
    require(!SoftwareUpdateDrivers::forPPD(agent, ppd.get()));
    return 0;
}
