#include <gtest/gtest.h>

#include "catalogue/DriverCatalogue.h"

namespace ventras {
namespace {

CatalogueReading shipped() {
    return DriverCatalogue::read(VENTRAS_TEST_SHIPPED_CATALOGUE);
}

TEST(ShippedCatalogue, CanBeRead) {
    const auto reading = shipped();
    ASSERT_TRUE(reading.catalogue) << reading.fault;
    EXPECT_EQ(reading.catalogue->release(), "debian 12");
}

TEST(ShippedCatalogue, ResolvesNearlyEveryDeviceToOnePackage) {
    const auto coverage = shipped().catalogue.value().coverage();
    EXPECT_GT(coverage.devices, 8000U);
    EXPECT_GT(static_cast<double>(coverage.resolved) / static_cast<double>(coverage.devices), 0.97);
}

TEST(ShippedCatalogue, LeavesOutSupersededPackages) {
    const auto reading = shipped();
    for (const auto& package : reading.catalogue.value().packages())
        for (const std::string superseded : {"hplip-data", "printer-driver-hpijs", "hpijs-ppds"})
            EXPECT_NE(package.name, superseded);
}

TEST(ShippedCatalogue, KnowsThePackagesOfWellKnownDevices) {
    struct Case {
        std::string deviceID, package;
    };
    // As the devices themselves spell it.
    const Case cases[] = {
        {"MFG:Brother;CMD:PJL,HBP;MDL:HL-L2300D series;CLS:PRINTER;", "printer-driver-brlaser"},
        {"MFG:EPSON;CMD:ESCPL2,BDC;MDL:XP-850 Series;CLS:PRINTER;", "printer-driver-escpr"},
        {"MFG:Hewlett-Packard;MDL:HP LaserJet 4;CMD:PCL;", "printer-driver-postscript-hp"},
        {"MFG:DYMO;MDL:LabelWriter 450;", "printer-driver-dymo"},
        {"MFG:Samsung;MDL:ML-1510;CMD:SPL;", "printer-driver-splix"},
        {"MFG:Canon;MDL:PIXMA MG5380;", "printer-driver-gutenprint"},
        {"MFG:HP;MDL:LaserJet 1018;", ""},  // foo2zjs and hpcups are equally good
        {"MFG:Acme;MDL:LaserJet 4;", ""},
    };
    const auto reading = shipped();
    for (const auto& [deviceID, package] : cases) {
        const auto best = reading.catalogue.value().packagesFor(deviceID);
        EXPECT_EQ(best.size() == 1 ? best.front()->name : "", package) << deviceID;
    }
}

}  // namespace
}  // namespace ventras
