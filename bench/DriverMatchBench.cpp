// Finding the drivers of one device in a catalogue of 20,000, against the same rules written plainly.

#include <array>
#include <cstdio>
#include <optional>
#include <string>
#include <vector>

#include "bench/AllocationCount.h"
#include "bench/NaiveMatching.h"
#include "bench/SpeedTable.h"
#include "bench/Stopwatch.h"
#include "bench/SyntheticCatalogue.h"
#include "drivers/PPDMatching.h"

namespace ventras {
namespace {

constexpr std::size_t kCatalogueSize = 20'000;
constexpr int kRounds = 15;

struct Device {
    std::string what;
    std::string deviceID;
    std::optional<std::string> model, product;
};

std::vector<Device> devices(const std::vector<PPDRecord>& catalogue) {
    constexpr std::size_t kSome = 12'006;  // has a device ID and a product
    constexpr std::size_t kNameOnly = 12'004;
    const auto& nameOnly = *catalogue[kNameOnly].makeAndModel;
    return {
        {"known by its device ID", *catalogue[kSome].deviceID, {}, {}},
        {"known by its product", "", {}, catalogue[kSome].product.front()},
        {"known by its name", "", nameOnly.substr(0, nameOnly.find(" - ")), {}},
        {"unknown", "MFG:Nobody;MDL:Nothing 1;CMD:X;", "Nothing 1", "(Nobody Nothing 1)"},
    };
}

template <typename Work>
double milliseconds(Work work) {
    const Stopwatch stopwatch;
    work();
    return stopwatch.milliseconds();
}

std::vector<std::size_t> fast(const Device& device, const std::vector<PPDRecord>& catalogue) {
    std::vector<std::size_t> positions;
    for (const auto& match :
         matchingDrivers(DeviceToMatch(device.deviceID, device.model, device.product), catalogue))
        positions.push_back(match.index);
    return positions;
}

double allocationsPerMiss(const Device& device, const std::vector<PPDRecord>& catalogue) {
    const DeviceToMatch prepared(device.deviceID, device.model, device.product);
    std::size_t misses = 0;
    std::size_t allocations = 0;
    for (const auto& record : catalogue) {
        const auto before = allocationCount();
        const bool matches = prepared.match(record).has_value();
        allocations += matches ? 0 : allocationCount() - before;
        misses += matches ? 0 : 1;
    }
    return static_cast<double>(allocations) / static_cast<double>(misses);
}

bool compare(const Device& device, const std::vector<PPDRecord>& catalogue, SpeedTable& table) {
    std::vector<double> fastTimes;
    std::vector<double> naiveTimes;
    std::vector<std::size_t> found;
    std::vector<std::size_t> expected;
    for (int i = 0; i < kRounds; ++i) {
        fastTimes.push_back(milliseconds([&] { found = fast(device, catalogue); }));
        naiveTimes.push_back(milliseconds([&] {
            expected = naive::matchingDrivers(device.deviceID, device.model, device.product, catalogue);
        }));
    }
    const auto label = "A device " + device.what + ": ";
    table.note(label + "drivers found", static_cast<double>(found.size()), "");
    table.note(label + "time", median(fastTimes), "ms");
    table.note(label + "time of the plain version", median(naiveTimes), "ms");
    table.atLeast(label + "times faster", median(naiveTimes) / median(fastTimes), 30, "");
    table.atMost(label + "allocations a driver that does not fit", allocationsPerMiss(device, catalogue), 0,
                 "");
    return found == expected;
}

int run() {
    const auto catalogue = syntheticCatalogue(kCatalogueSize);
    SpeedTable table;
    bool same = true;
    for (const auto& device : devices(catalogue))
        same = compare(device, catalogue, table) && same;
    const bool reached = table.print();
    if (!same)
        std::puts("The two versions do not find the same drivers.");
    return same && reached ? 0 : 1;
}

}  // namespace
}  // namespace ventras

int main() {
    return ventras::run();
}
