#include <gmock/gmock.h>

#include "agent/CommandLine.h"
#include "tests/package/HelpText.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* kAgentOptions[] = {"--download", "--skerrow", "--scanner", "-u", "-s"};

/// What bash offers for the last word of a command line that is made of these.
Words offeredByBash(std::vector<std::string> words, const std::string& folder = "/") {
    // Outside of an interactive shell nobody can be told how to complete further.
    const std::string script =
        "compopt() { :; }; program=$0; . " VENTRAS_COMPLETIONS
        "/bash/$program;"
        "COMP_WORDS=(\"$@\"); COMP_CWORD=$(($# - 1)); _$program; printf '%s\\n' \"${COMPREPLY[@]}\"";
    std::vector<std::string> command{"bash", "-uc", script, words.front()};
    command.insert(command.end(), words.begin(), words.end());
    const auto result = runProgram(command, {.workingFolder = folder});
    EXPECT_EQ(result.standardError, "");
    return matchesOf(result.standardOutput, "([^\n]+)\n");
}

TEST(BashCompletion, OffersTheCommandsOfTheTool) {
    EXPECT_EQ(offeredByBash({"ventrasctl", ""}), toolCommands());
    EXPECT_THAT(offeredByBash({"ventrasctl", "--json", "dev"}), ElementsAre("device-id"));
}

TEST(BashCompletion, OffersTheOptionsOfTheTool) {
    EXPECT_EQ(offeredByBash({"ventrasctl", "--"}), toolOptions());
}

TEST(BashCompletion, OffersTheOptionsOfEachCommand) {
    for (const auto& command : toolCommands()) {
        auto options = toolOptions(command);
        if (command == "explain")
            options.insert(std::begin(kAgentOptions), std::end(kAgentOptions));
        EXPECT_EQ(offeredByBash({"ventrasctl", command, "-"}), options) << command;
    }
}

TEST(BashCompletion, OffersFilesWhereFilesAreWanted) {
    const TemporaryFolder folder;
    folder.write("one.ppd", "");
    folder.write("two.ppd", "");
    for (const auto& words :
         std::vector<std::vector<std::string>>{{"ventrasctl", "ppd", "o"},
                                               {"ventrasctl", "ppd", "two.ppd", "o"},
                                               {"ventrasctl", "match", "--catalogue", "o"},
                                               {"ventrasctl", "match", "--catalogue", "=", "o"},
                                               {"ventrasctl", "catalogue", "build", "o"}})
        EXPECT_THAT(offeredByBash(words, folder.path()), ElementsAre("one.ppd"));
    EXPECT_THAT(offeredByBash({"ventrasctl", "match", "--catalogue", "="}, folder.path()),
                ElementsAre("one.ppd", "two.ppd"));
}

TEST(BashCompletion, OffersNothingForATextOfTheDevices) {
    EXPECT_THAT(offeredByBash({"ventrasctl", "match", "--model", ""}), IsEmpty());
    EXPECT_THAT(offeredByBash({"ventrasctl", "device-id", ""}), IsEmpty());
}

TEST(BashCompletion, OffersWhatTheAgentTakes) {
    auto offered = offeredByBash({"ventrasagent", "-"});
    EXPECT_THAT(offered, testing::UnorderedElementsAreArray(kAgentOptions));
    offered.merge(offeredByBash({"ventrasagent", ""}));
    for (const auto& argument : offered)
        EXPECT_NE(parseArgument(argument).kind, ArgumentKind::Ignored) << argument;
    EXPECT_THAT(offeredByBash({"ventrasagent", "-u1,0", "ipps"}), ElementsAre("ipps://"));
}

/// What an interactive zsh offers for the last word of a command line.
Words offeredByZsh(const std::string& line, const std::string& folder = "/") {
    const TemporaryFolder answer;
    const auto offered = answer / "offered";
    const auto result =
        runProgram({"zsh", "-f", VENTRAS_COMPLETE_ZSH, VENTRAS_COMPLETIONS "/zsh", offered, line},
                   {.workingFolder = folder});
    auto words = matchesOf(readFile(offered), "([^\n]+)\n");
    EXPECT_EQ(words.erase("END"), 1U) << result.standardError;
    return words;
}

TEST(ZshCompletion, OffersTheCommandsOfTheTool) {
    EXPECT_EQ(offeredByZsh("ventrasctl "), toolCommands());
    EXPECT_THAT(offeredByZsh("ventrasctl --json dev"), ElementsAre("device-id"));
}

TEST(ZshCompletion, OffersTheOptionsOfTheTool) {
    EXPECT_EQ(offeredByZsh("ventrasctl --"), toolOptions());
}

TEST(ZshCompletion, OffersTheOptionsOfEachCommand) {
    for (const auto& command : toolCommands()) {
        auto options = toolOptions(command);
        if (command == "explain")
            options.insert(std::begin(kAgentOptions), std::end(kAgentOptions));
        EXPECT_EQ(offeredByZsh("ventrasctl " + command + " -"), options) << command;
    }
}

TEST(ZshCompletion, OffersFilesWhereFilesAreWanted) {
    const TemporaryFolder folder;
    folder.write("one.ppd", "");
    folder.write("two.ppd", "");
    for (const std::string line : {"ventrasctl ppd o", "ventrasctl ppd two.ppd o",
                                   "ventrasctl match --catalogue=o", "ventrasctl match --catalogue o",
                                   "ventrasctl catalogue --file=o", "ventrasctl catalogue --output o"})
        EXPECT_THAT(offeredByZsh(line, folder.path()), ElementsAre("one.ppd")) << line;
}

TEST(ZshCompletion, OffersNothingForATextOfTheDevices) {
    EXPECT_THAT(offeredByZsh("ventrasctl match --model="), IsEmpty());
    EXPECT_THAT(offeredByZsh("ventrasctl device-id "), IsEmpty());
}

TEST(ZshCompletion, OffersWhatTheAgentTakes) {
    EXPECT_THAT(offeredByZsh("ventrasagent -"), testing::UnorderedElementsAreArray(kAgentOptions));
    EXPECT_THAT(offeredByZsh("ventrasagent -u1,0 ipps"), ElementsAre("ipps://"));
}

}  // namespace
}  // namespace ventras
