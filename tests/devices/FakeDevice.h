#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>

#include "devices/VentrasPrinterObject.h"

namespace ventras {

/// A device of no kind that the agent knows, which tells what a test gives it.
class FakeDevice final : public VentrasPrinterObject {
public:
    using Text = std::optional<std::string>;

    explicit FakeDevice(Text name = {}, Text scanID = {}, Text uri = {})
        : name_(std::move(name)), scanID_(std::move(scanID)), uri_(std::move(uri)) {}

    Text name() override { return name_; }
    Text softwareUpdateScanDeviceID() override { return scanID_; }
    Text deviceURI() override { return uri_; }

private:
    Text name_, scanID_, uri_;
};

}  // namespace ventras
