#include "bench/SyntheticCatalogue.h"

#include <array>
#include <random>
#include <string>

namespace ventras {
namespace {

constexpr std::array kMakes{"HP",    "Canon",   "Epson", "Brother", "Lexmark",
                            "Ricoh", "Kyocera", "Oki",   "Xerox",   "Acme"};
constexpr std::array kSeries{"LaserJet",   "DeskJet",   "PIXMA", "Stylus",
                             "Office/Jet", "Aficio SP", "FS",    "Phaser"};

PPDRecord record(std::size_t number, std::mt19937& random) {
    const std::string make = kMakes[random() % kMakes.size()];
    const std::string model = std::string(kSeries[random() % kSeries.size()]) + " " + std::to_string(number) +
                              (number % 3 == 0 ? " series" : "");
    PPDRecord record;
    record.make = make;
    record.makeAndModel = make + " " + model + ", driver 3.22";
    record.naturalLanguage = {"en"};
    record.modelNumber = "0";
    record.type = number % 5 == 0 ? "raster" : "postscript";
    record.deviceID = "";
    // The scheduler knows nothing but the names of a third of the drivers.
    if (number % 3 == 1) {
        record.name = "gutenprint.5.3://" + std::to_string(number) + "/expert";
        record.makeAndModel = make + " " + model + " - CUPS+Gutenprint v5.3.4";
        return record;
    }
    record.name = "drv:///synthetic.drv/" + std::to_string(number) + ".ppd";
    record.product = {"(" + make + " " + model + ")"};
    if (number % 7 == 0)
        record.product.push_back("(" + make + " " + model + "/Duplex)");
    if (number % 2 == 0)
        record.deviceID = "MFG:" + make + ";MDL:" + model + ";CMD:PCL,PJL;";
    return record;
}

}  // namespace

std::vector<PPDRecord> syntheticCatalogue(std::size_t count) {
    constexpr unsigned kSeed = 20000;
    std::mt19937 random(kSeed);
    std::vector<PPDRecord> records;
    records.reserve(count);
    for (std::size_t number = 0; number < count; ++number)
        records.push_back(record(number, random));
    return records;
}

}  // namespace ventras
