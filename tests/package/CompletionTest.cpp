#include <gmock/gmock.h>

#include "agent/CommandLine.h"
#include "tests/package/HelpText.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;

constexpr const char* kAgentOptions[] = {"--download", "--skerrow", "--scanner", "-u", "-s"};

/// What bash offers for the last word of a command line that is made of these.
Words completed(std::vector<std::string> words, const std::string& folder = "/") {
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
    EXPECT_EQ(completed({"ventrasctl", ""}), toolCommands());
    EXPECT_THAT(completed({"ventrasctl", "--json", "dev"}), ElementsAre("device-id"));
}

TEST(BashCompletion, OffersTheOptionsOfTheTool) {
    EXPECT_EQ(completed({"ventrasctl", "--"}), toolOptions());
}

TEST(BashCompletion, OffersTheOptionsOfEachCommand) {
    for (const auto& command : toolCommands()) {
        auto options = toolOptions(command);
        if (command == "explain")
            options.insert(std::begin(kAgentOptions), std::end(kAgentOptions));
        EXPECT_EQ(completed({"ventrasctl", command, "-"}), options) << command;
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
        EXPECT_THAT(completed(words, folder.path()), ElementsAre("one.ppd"));
    EXPECT_THAT(completed({"ventrasctl", "match", "--catalogue", "="}, folder.path()),
                ElementsAre("one.ppd", "two.ppd"));
}

TEST(BashCompletion, OffersNothingForATextOfTheDevices) {
    EXPECT_THAT(completed({"ventrasctl", "match", "--model", ""}), IsEmpty());
    EXPECT_THAT(completed({"ventrasctl", "device-id", ""}), IsEmpty());
}

TEST(BashCompletion, OffersWhatTheAgentTakes) {
    auto offered = completed({"ventrasagent", "-"});
    EXPECT_THAT(offered, testing::UnorderedElementsAreArray(kAgentOptions));
    offered.merge(completed({"ventrasagent", ""}));
    for (const auto& argument : offered)
        EXPECT_NE(parseArgument(argument).kind, ArgumentKind::Ignored) << argument;
    EXPECT_THAT(completed({"ventrasagent", "-u1,0", "ipps"}), ElementsAre("ipps://"));
}

TEST(ZshCompletion, IsReadByZsh) {
    for (const std::string program : {"ventrasctl", "ventrasagent"}) {
        const auto result = runProgram({"zsh", "-fn", VENTRAS_COMPLETIONS "/zsh/_" + program});
        EXPECT_EQ(result.exitStatus, 0) << result.standardError;
    }
}

TEST(ZshCompletion, HasTheCommandsAndOptionsOfTheTool) {
    const auto source = readFile(VENTRAS_COMPLETIONS "/zsh/_ventrasctl");
    EXPECT_EQ(matchesOf(source, "\n            ['\"]([a-z-]+):"), toolCommands());
    auto options = toolOptions();
    for (const auto& command : toolCommands())
        options.merge(toolOptions(command));
    EXPECT_THAT(matchesOf(source, "['*](--[a-z-]+?)-?=?\\["), IsSupersetOf(options));
}

TEST(ZshCompletion, HasWhatTheAgentTakes) {
    const auto source = readFile(VENTRAS_COMPLETIONS "/zsh/_ventrasagent");
    EXPECT_THAT(matchesOf(source, "'\\*(-[a-z-]+?)-?\\["), testing::UnorderedElementsAreArray(kAgentOptions));
}

}  // namespace
}  // namespace ventras
