#include <cstddef>
#include <cstdint>
#include <string>

#include "drivers/PPDParser.h"
#include "drivers/SoftwareUpdateDrivers.h"
#include "fuzz/FileInMemory.h"
#include "fuzz/RecordChecks.h"
#include "fuzz/Require.h"
#include "platform/PrintToolAgentChannel.h"
#include "platform/Utf8.h"

// A PPD comes out of a driver package, or over the network out of a printer. Each input is read as a PPD
// file; what comes of it goes the way that a driver's record goes, and the few things that hold for any file
// are checked.

namespace {

using namespace ventras;

/// Knows no driver for any device.
class NoAgent final : public PrintToolAgentChannel {
public:
    PrintToolAgentReply sendCommandSync(std::string_view, std::int32_t,
                                        const PropertyDictionary& arguments) override {
        require(isValidUtf8(*findText(arguments, "scanID")));
        return {1, {}};
    }
};

}  // namespace

// libcups itself loses the earlier values of a keyword that is repeated, e.g. `LanguageEncoding`.
extern "C" const char* __lsan_default_suppressions() {
    return "leak:_ppdOpen";
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const FileInMemory file;
    file.hold({reinterpret_cast<const char*>(data), size});
    beginsAsPPD(file.path());
    const auto record = parsePPDFile(file.path());
    if (!record)
        return 0;

    checkRecord(*record);
    NoAgent agent;
    const PpdPtr ppd{ppdOpenFile(file.path().c_str())};
    require(!SoftwareUpdateDrivers::forPPD(agent, ppd.get()));
    return 0;
}
