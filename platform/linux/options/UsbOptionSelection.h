#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/PrintSystemService.h"
#include "platform/linux/options/NewPpd.h"
#include "platform/linux/options/PpdQueries.h"
#include "platform/linux/options/UsbPostScriptChannel.h"
#include "platform/linux/usb/LibusbDevice.h"

namespace ventras {

class Log;

/// Auto-selection for a USB printer: a PostScript interpreter is asked for its product, and what is installed
/// in the printer, by the PPD's own programs. A printer that does not answer, or speaks no PostScript, leaves
/// everything as it is; that is no failure of the options. Use it on one thread.
class UsbOptionSelection : public AutoSelectContext {
public:
    /// Longest time for one answer, and for all of a PPD's.
    static constexpr std::chrono::milliseconds kAnswerLimit = std::chrono::seconds(10);
    static constexpr std::chrono::milliseconds kLimit = std::chrono::seconds(30);

    /// @param log outlives the context
    UsbOptionSelection(std::string deviceURI, Log& log) : deviceURI_(std::move(deviceURI)), log_(log) {}

    std::int32_t autoSelectPPD() override;
    AutoSelectInfo autoSelectGetInfo() const override { return info_; }
    void autoSelectSetIsBinaryOK(bool isBinaryOK) override { info_.isBinaryOK = isBinaryOK; }
    std::int32_t autoSelectInstallableOptions(const std::string& ppdPath) override;
    std::optional<std::string> autoSelectHasNewPPD() const override { return newPPD_.take(); }

private:
    std::unique_ptr<UsbPostScriptChannel> openChannel();
    std::map<std::string, std::string> askAbout(const std::vector<PpdQuery>& queries);

    std::string deviceURI_;
    Log& log_;
    LibusbContext context_;
    AutoSelectInfo info_;
    NewPpd newPPD_;
};

}  // namespace ventras
