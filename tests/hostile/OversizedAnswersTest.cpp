#include "tests/hostile/HostileRun.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/UsbBench.h"

// Counts and lengths that nobody expects. A printer with thousands of attributes is tested with faulty
// printers.

namespace ventras {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;

// libcups moves all it has for each one that it adds, and sanitizers watch every move.
constexpr int kVeryMany = kAllowance > 1 ? 30'000 : 100'000;
constexpr long kMostKilobytes = 300'000 * kAllowance;
constexpr auto kLongest = 20s * kAllowance;

struct OversizedCase {
    const char* name;
    std::vector<RawAttribute> (*attributes)();
    int status;
};

void PrintTo(const OversizedCase& row, std::ostream* out) {
    *out << row.name;
}

std::vector<RawAttribute> manyAttributes() {
    std::vector<RawAttribute> all;
    for (int i = 0; i < kVeryMany; ++i)
        all.push_back({IPP_TAG_KEYWORD, "x-" + std::to_string(i), "y"});
    return all;
}

// Values of one attribute: those behind the first come without a name.
std::vector<RawAttribute> manyValues(const char* name, ipp_tag_t tag, const std::string& value) {
    std::vector<RawAttribute> all{{tag, name, value}};
    all.resize(kVeryMany, {tag, "", value});
    return all;
}

std::vector<RawAttribute> collections(int depth) {
    std::vector<RawAttribute> all{{IPP_TAG_BEGIN_COLLECTION, "media-col-default", ""}};
    for (int i = 1; i < depth; ++i) {
        all.push_back({IPP_TAG_MEMBERNAME, "", "media-size"});
        all.push_back({IPP_TAG_BEGIN_COLLECTION, "", ""});
    }
    all.resize(all.size() + static_cast<std::size_t>(depth), {IPP_TAG_END_COLLECTION, "", ""});
    return all;
}

class OversizedAnswers : public HostileRun, public testing::WithParamInterface<OversizedCase> {
protected:
    Agent agent_{scheduler_};
};

INSTANTIATE_TEST_SUITE_P(
    All, OversizedAnswers,
    testing::Values(
        OversizedCase{"VeryManyAttributes", manyAttributes, 0},
        OversizedCase{"VeryManySizes",
                      [] { return manyValues("media-supported", IPP_TAG_KEYWORD, "iso_a4_210x297mm"); }, 0},
        OversizedCase{"VeryManyResolutions",
                      [] {
                          return manyValues("printer-resolution-supported", IPP_TAG_RESOLUTION,
                                            "\0\0\2\x58\0\0\2\x58\3"s);
                      },
                      0},
        OversizedCase{"VeryManyFormats",
                      [] { return manyValues("document-format-supported", IPP_TAG_MIMETYPE, "image/urf"); },
                      0},
        OversizedCase{"VeryManyNames",
                      [] { return manyValues("printer-dns-sd-name", IPP_TAG_NAME, "Victim"); }, 0},
        OversizedCase{"ACollectionForEachThing", [] { return collections(3); }, 0},
        OversizedCase{"CollectionsDeepWithinCollections", [] { return collections(10'000); }, 255},
        OversizedCase{"CollectionsWithoutEnd", [] { return collections(200'000); }, 255},
        OversizedCase{
            "AnAnswerOfTwentyMegabytes",
            [] {
                return std::vector<RawAttribute>(700, {IPP_TAG_TEXT, "x-long", std::string(30'000, 'x')});
            },
            255},
        OversizedCase{"ANameOfThirtyKilobytes",
                      [] {
                          return std::vector<RawAttribute>{
                              {IPP_TAG_NAME, "printer-dns-sd-name", std::string(30'000, 'n')}};
                      },
                      0}),
    [](const auto& test) { return test.param.name; });

TEST_P(OversizedAnswers, AreReadOrRefusedInTime) {
    const ScriptedPrinter printer(
        {.name = "Victim", .edit = [](ipp_t*) {}, .rawAttributes = GetParam().attributes()});
    const auto run = agent_.run({printer.uri()}, 2 * kLongest);
    EXPECT_EQ(run.exitStatus, GetParam().status) << run.story();
    EXPECT_EQ(newQueues().size(), GetParam().status == 0 ? 1U : 0U) << run.story();
    EXPECT_LT(run.wallTime, kLongest);
    EXPECT_LT(run.peakKilobytes, kMostKilobytes);
    expectHarmless(agent_, run);
}

class OversizedDevice : public HostileRun {
protected:
    Environment environment() const {
        auto all = scheduler_.environment();
        all.merge(bench_.environment());
        return all;
    }

    AgentRun runWith(FakePrinterModel model) {
        bench_.plugIn("1-4", std::move(model));
        const auto run = agent_.run({"-u20971520,0", "-u20971520,1", "--download"});
        EXPECT_LT(run.wallTime, kLongest);
        expectHarmless(agent_, run);
        bench_.unplug("1-4");
        return run;
    }

    UsbBench bench_;
    Agent agent_{environment(), std::nullopt};
};

TEST_F(OversizedDevice, WithHundredsOfInterfacesIsLookedAt) {
    FakePrinterModel model;
    model.settings.clear();
    for (int i = 0; i < 200; ++i)
        model.settings.push_back(
            {.interface = static_cast<std::uint8_t>(i % 32), .alternate = static_cast<std::uint8_t>(i / 32)});
    EXPECT_GT(runWith(std::move(model)).exitStatus, 0);
}

TEST_F(OversizedDevice, WithoutAnyInterfaceIsNoPrinter) {
    FakePrinterModel model;
    model.settings.clear();
    EXPECT_EQ(runWith(std::move(model)).exitStatus, 255);
}

TEST_F(OversizedDevice, WithAnIDOfSixtyKilobytesIsRead) {
    FakePrinterModel model;
    model.deviceID = "MFG:Acme;MDL:" + std::string(60'000, 'x') + ";CMD:PCL;SN:1;";
    EXPECT_GT(runWith(std::move(model)).exitStatus, 0);
}

}  // namespace
}  // namespace ventras
