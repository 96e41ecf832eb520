#pragma once

#include <filesystem>

#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {

/// Makes the generic driverless driver one that is known and whose PPD has disappeared since. It outlives
/// what uses the drivers.
class LostGenericDriver {
public:
    LostGenericDriver(FakePlatform& fake, PPDManager& drivers) {
        fake.resources.folder = resources_.path();
        const auto ppd = resources_.write("Vellum.ppd",
                                          "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*ModelName: \"V\"\n"
                                          "*NickName: \"V\"\n*PSVersion: \"(1) 0\"\n");
        drivers.genericURFPPD();
        std::filesystem::remove(ppd);
    }

private:
    TemporaryFolder resources_;
};

}  // namespace ventras
