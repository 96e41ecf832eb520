#pragma once

#include "drivers/PPDRecord.h"

/// How good a driver is in general, whatever the device. Any thread may call.
namespace ventras::PPDKind {

/// Lower is better; driver lists are sorted by it.
enum Kind : unsigned {
    kSecureDriverless = 0,
    kDriverless = 1,
    kInstalledLocalized = 2,
    kInstalled = 3,
    kSoftwareUpdate = 4,
    kSoftwareUpdateWithConflicts = 5,
    kInstalledHpijs = 6,
    kServerLocalized = 7,
    kServer = 8,
    kTioga = 9,
    kNone = 10,
};

Kind of(const PPDRecord& record);

}  // namespace ventras::PPDKind
