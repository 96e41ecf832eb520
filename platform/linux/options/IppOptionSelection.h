#pragma once

#include <optional>
#include <string>

#include "platform/PrintSystemService.h"
#include "platform/linux/options/NewPpd.h"

namespace ventras {

class Log;

/// Auto-selection for a printer that speaks IPP: its own description of itself becomes the queue's PPD, with
/// just the trays, sizes, colours and resolutions that it has. A printer that does not answer, or not
/// sensibly, leaves the PPD as it is; that is no failure. Use it on one thread.
class IppOptionSelection : public AutoSelectContext {
public:
    /// @param log outlives the context
    IppOptionSelection(std::string deviceURI, Log& log) : deviceURI_(std::move(deviceURI)), log_(log) {}

    std::int32_t autoSelectPPD() override;
    AutoSelectInfo autoSelectGetInfo() const override { return {std::nullopt, isBinaryOK_}; }
    void autoSelectSetIsBinaryOK(bool isBinaryOK) override { isBinaryOK_ = isBinaryOK; }
    std::int32_t autoSelectInstallableOptions(const std::string& ppdPath) override;
    std::optional<std::string> autoSelectHasNewPPD() const override { return newPPD_.take(); }

private:
    std::string deviceURI_;
    Log& log_;
    bool isBinaryOK_ = false;
    NewPpd newPPD_;
};

}  // namespace ventras
