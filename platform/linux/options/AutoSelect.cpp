#include "platform/linux/options/AutoSelect.h"

#include <array>
#include <string_view>

#include "platform/linux/options/IppOptionSelection.h"
#include "platform/linux/options/UsbOptionSelection.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

// For devices that cannot be asked: the driver stays as it is.
class NoSelection : public AutoSelectContext {
public:
    std::int32_t autoSelectPPD() override { return PrintSystemStatus::kUnavailable; }
    AutoSelectInfo autoSelectGetInfo() const override { return {std::nullopt, isBinaryOK_}; }
    void autoSelectSetIsBinaryOK(bool isBinaryOK) override { isBinaryOK_ = isBinaryOK; }
    std::int32_t autoSelectInstallableOptions(const std::string&) override {
        return PrintSystemStatus::kSuccess;
    }
    std::optional<std::string> autoSelectHasNewPPD() const override { return std::nullopt; }

private:
    bool isBinaryOK_ = false;
};

using Maker = std::unique_ptr<AutoSelectContext> (*)(const std::string& deviceURI, Log& log);

struct Row {
    std::string_view prefix;
    Maker make;
};

std::unique_ptr<AutoSelectContext> makeIpp(const std::string& deviceURI, Log& log) {
    return std::make_unique<IppOptionSelection>(deviceURI, log);
}

std::unique_ptr<AutoSelectContext> makeUsb(const std::string& deviceURI, Log& log) {
    return std::make_unique<UsbOptionSelection>(deviceURI, log);
}

constexpr std::array kContexts{Row{"ipp://"sv, makeIpp}, Row{"ipps://"sv, makeIpp},
                               Row{"ippusb://"sv, makeIpp}, Row{"usb://"sv, makeUsb}};

}  // namespace

std::unique_ptr<AutoSelectContext> makeAutoSelectContext(const std::string& deviceURI, Log& log) {
    for (const auto& [prefix, make] : kContexts)
        if (deviceURI.starts_with(prefix))
            return make(deviceURI, log);
    return std::make_unique<NoSelection>();
}

}  // namespace ventras
