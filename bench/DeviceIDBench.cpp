// A million different device IDs through every question that can be asked of one.
#include <benchmark/benchmark.h>

#include <array>
#include <random>
#include <string>
#include <string_view>
#include <vector>

#include "bench/AllocationCount.h"
#include "deviceid/PMStringAdditions.h"

namespace ventras {
namespace {

constexpr std::size_t kCount = 1'000'000;

constexpr std::array kMakes{"HP",      "Hewlett-Packard",       "Canon", "EPSON",
                            "Brother", "Lexmark International", "Acme"};
constexpr std::array kModels{"LaserJet 4",       "HP LaserJet 4", "iP4200",      "Stylus Photo R300",
                             "HL-5450DN series", "Lexmark E120",  "deskjet 990c"};
constexpr std::array kLanguages{"PCL,PJL", "PCL,PS,PJL", "PostScript Level 3", "ESCPL2,BDC",
                                "PWGRaster,URF,PDF"};

// The shapes that printers send: short and long keys, a product text only, TXT keys, many components.
std::string deviceID(std::mt19937& random) {
    const auto pick = [&random](const auto& texts) -> std::string { return texts[random() % texts.size()]; };
    const auto number = std::to_string(random());
    switch (random() % 4) {
        case 0:
            return "MFG:" + pick(kMakes) + ";MDL:" + pick(kModels) + ";CMD:" + pick(kLanguages) +
                   ";SN:" + number + ";";
        case 1:
            return "MANUFACTURER:" + pick(kMakes) + ";COMMAND SET:" + pick(kLanguages) +
                   ";MODEL:" + pick(kModels) + ";CLASS:PRINTER;DESCRIPTION:" + pick(kModels) +
                   ";SERN:" + number + ";CID:" + pick(kModels) + ";";
        case 2:
            return "product:(" + pick(kMakes) + " " + pick(kModels) +
                   ");pdl:application/pdf,image/urf;scan:T;";
        default:
            return "usb_MFG:" + pick(kMakes) + ";usb_MDL:" + pick(kModels) + ";usb_CMD:" + pick(kLanguages) +
                   ";usb_SN:" + number + ";Color:T;Duplex:F;note:room " + number + ";";
    }
}

const std::vector<std::string>& deviceIDs() {
    static const auto all = [] {
        constexpr unsigned kSeed = 1284;
        std::mt19937 random(kSeed);
        std::vector<std::string> ids(kCount);
        for (auto& id : ids)
            id = deviceID(random);
        return ids;
    }();
    return all;
}

template <typename Question>
void ask(benchmark::State& state, Question question) {
    const auto& ids = deviceIDs();
    std::size_t allocations = 0;
    std::size_t strings = 0;
    for (auto _ : state) {
        const auto before = allocationCount();
        for (const auto& id : ids)
            question(id);
        allocations += allocationCount() - before;
        strings += ids.size();
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(strings));
    state.counters["allocations/string"] = static_cast<double>(allocations) / static_cast<double>(strings);
}

const auto kEveryQuestion = [](std::string_view id) {
    using namespace PMStringAdditions;
    benchmark::DoNotOptimize(commandSet(id));
    benchmark::DoNotOptimize(compatibleIDs(id));
    benchmark::DoNotOptimize(make(id));
    benchmark::DoNotOptimize(model(id));
    benchmark::DoNotOptimize(serialNumber(id));
    benchmark::DoNotOptimize(product(id));
    benchmark::DoNotOptimize(deviceName(id));
    benchmark::DoNotOptimize(softwareUpdateScaneID(id));
    benchmark::DoNotOptimize(dictionaryValue(id));
    benchmark::DoNotOptimize(supportsPostscript(id));
    benchmark::DoNotOptimize(supportsPCL(id));
    benchmark::DoNotOptimize(supportsScanning(id));
    benchmark::DoNotOptimize(pmStringByAddingPercentEscapesUsingEncoding(id, "UTF-8"));
};

// One benchmark for all questions together, and one for each that is asked of every driver or device.
BENCHMARK_CAPTURE(ask, everything, kEveryQuestion)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, make, PMStringAdditions::make)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, model, PMStringAdditions::model)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, product, PMStringAdditions::product)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, deviceName, PMStringAdditions::deviceName)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, commandSet, PMStringAdditions::commandSet)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(ask, dictionaryValue, PMStringAdditions::dictionaryValue)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace ventras

BENCHMARK_MAIN();
