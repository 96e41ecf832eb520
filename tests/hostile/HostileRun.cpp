#include "tests/hostile/HostileRun.h"

#include <strings.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "platform/Utf8.h"
#include "tests/parts/OpenedPpd.h"

namespace ventras {
namespace {

constexpr const char* kDriver =
    "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*FileVersion: \"1.0\"\n*LanguageVersion: English\n"
    "*LanguageEncoding: ISOLatin1\n*PCFileName: \"ACME.PPD\"\n*Manufacturer: \"Acme\"\n*Product: "
    "\"(Laser)\"\n"
    "*ModelName: \"Acme Laser\"\n*ShortNickName: \"Acme Laser\"\n*NickName: \"Acme Laser\"\n"
    "*PSVersion: \"(3010.000) 0\"\n*1284DeviceID: \"MFG:Acme;MDL:Laser;\"\n"
    "*cupsFilter: \"application/vnd.cups-postscript 0 foomatic-rip\"\n*FoomaticRIPCommandLine: \"gs -q -\"\n"
    "*OpenUI *PageSize: PickOne\n*DefaultPageSize: A4\n*PageSize A4/A4: \"\"\n*CloseUI: *PageSize\n"
    "*OpenUI *PageRegion: PickOne\n*DefaultPageRegion: A4\n*PageRegion A4/A4: \"\"\n*CloseUI: *PageRegion\n"
    "*DefaultImageableArea: A4\n*ImageableArea A4/A4: \"0 0 595 842\"\n"
    "*DefaultPaperDimension: A4\n*PaperDimension A4/A4: \"595 842\"\n";

bool beginsIgnoringCase(const std::string& line, std::string_view beginning) {
    return strncasecmp(line.c_str(), beginning.data(), beginning.size()) == 0;
}

}  // namespace

Names evilLines(const std::string& ppd) {
    Names evil;
    std::string text = ppd;
    std::ranges::replace(text, '\r', '\n');
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);)
        if ((beginsIgnoringCase(line, "*cups") || beginsIgnoringCase(line, "*FoomaticRIP")) &&
            line.find("evil") != std::string::npos)
            evil.push_back(line);
    return evil;
}

bool isPlain(const std::string& text) {
    std::string inOneLine = text;
    std::ranges::replace(inOneLine, '\n', ' ');
    return isValidUtf8(inOneLine) && !hasControlCharacters(inOneLine);
}

void HostileRun::SetUp() {
    scheduler_.addQueue(kPresent, "usb://Acme/Present", readFile(testDocument("colour-duplex.ppd")));
    before_ = stateOfQueues(scheduler_, {kPresent});
}

void HostileRun::installDriver() const {
    // Drivers below a folder of this name count as installed on this computer.
    const auto folder = scheduler_.folder() / "data/model/Library/Printers";
    std::filesystem::create_directories(folder);
    std::ofstream(folder / "acme.ppd") << kDriver;
}

Names HostileRun::newQueues() const {
    auto queues = scheduler_.queues();
    std::erase(queues, kPresent);
    return queues;
}

void HostileRun::expectHarmless(const Agent& agent, const AgentRun& run) const {
    EXPECT_FALSE(run.timedOut) << run.story();
    EXPECT_EQ(run.signal, 0) << run.story();
    EXPECT_TRUE(isPlain(run.standardOutput)) << testing::PrintToString(run.standardOutput);
    EXPECT_TRUE(isPlain(run.standardError)) << testing::PrintToString(run.standardError);
    EXPECT_EQ(agent.leftovers(), Names{});
    EXPECT_EQ(stateOfQueues(scheduler_, {kPresent}), before_);
    for (const auto& queue : newQueues()) {
        const auto ppd = scheduler_.ppd(queue);
        EXPECT_TRUE(openedPpd(ppd)) << queue << " is a raw queue";
        EXPECT_EQ(evilLines(ppd), Names{}) << queue;
        EXPECT_EQ(scheduler_.attribute(queue, "printer-state"), "3") << queue;
        EXPECT_EQ(scheduler_.attribute(queue, "printer-is-accepting-jobs"), "true") << queue;
    }
}

}  // namespace ventras
