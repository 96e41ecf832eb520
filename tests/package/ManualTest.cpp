#include <gmock/gmock.h>

#include <filesystem>

#include "agent/CommandLine.h"
#include "tests/package/HelpText.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using testing::IsSupersetOf;

std::vector<fs::path> pages() {
    std::vector<fs::path> found;
    for (const auto& entry : fs::directory_iterator(VENTRAS_MANUAL))
        if (const auto section = entry.path().extension().string();
            section.size() == 2 && std::isdigit(section[1]))
            found.push_back(entry.path());
    return found;
}

std::string page(const std::string& name) {
    return readFile(fs::path(VENTRAS_MANUAL) / name);
}

Words withDashes(const Words& flags) {
    Words options;
    for (const auto& flag : flags)
        options.insert("-" + flag);
    return options;
}

TEST(Manual, HasAPageForEachProgramAndFile) {
    EXPECT_EQ(pages().size(), 6U);
}

TEST(Manual, IsWellFormed) {
    for (const auto& file : pages()) {
        const auto lint = runProgram({"mandoc", "-Tlint", "-Wwarning", file});
        EXPECT_EQ(lint.exitStatus, 0) << lint.standardOutput;
    }
}

TEST(Manual, IsShownWithoutAWarning) {
    for (const auto& file : pages()) {
        const auto shown =
            runProgram({"man", "--warnings", "-E", "UTF-8", "-l", "-Tutf8", "-Z", file},
                       {.environment = {{"LC_ALL", "C.UTF-8"}, {"MANROFFSEQ", ""}, {"MANWIDTH", "80"}}});
        EXPECT_EQ(shown.exitStatus, 0) << file;
        EXPECT_EQ(shown.standardError, "") << file;
        EXPECT_FALSE(shown.standardOutput.empty()) << file;
    }
}

TEST(Manual, HasTheCommandsOfTheToolAndNoOthers) {
    EXPECT_EQ(matchesOf(page("ventrasctl.1"), "\n\\.(?:It |It Xo\n\\.)Cm ([a-z-]+)"), toolCommands());
}

TEST(Manual, HasTheOptionsOfTheToolAndNoOthers) {
    auto options = toolOptions();
    for (const auto& command : toolCommands())
        options.merge(toolOptions(command));
    EXPECT_EQ(withDashes(matchesOf(page("ventrasctl.1"), "Fl (-[a-z-]+)")), options);
}

TEST(Manual, HasTheArgumentsOfTheAgentAndNoOthers) {
    auto arguments = withDashes(matchesOf(page("ventrasagent.8"), "Fl ([a-z-]+)"));
    arguments.merge(matchesOf(page("ventrasagent.8"), "Cm ([a-z]+://)"));
    std::set<ArgumentKind> kinds;
    for (const auto& argument : arguments) {
        const auto kind = parseArgument(argument).kind;
        EXPECT_NE(kind, ArgumentKind::Ignored) << argument;
        kinds.insert(kind);
    }
    EXPECT_THAT(kinds, IsSupersetOf({ArgumentKind::Deprecated, ArgumentKind::UsbLocation,
                                     ArgumentKind::Scanner, ArgumentKind::NoDownload, ArgumentKind::Skerrow,
                                     ArgumentKind::IppUsb, ArgumentKind::NetworkURI}));
    EXPECT_THAT(arguments, IsSupersetOf({"--scanner", "-s", "ipp://", "ipps://"}));
}

}  // namespace
}  // namespace ventras
