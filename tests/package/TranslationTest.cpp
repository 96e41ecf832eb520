#include <gmock/gmock.h>

#include <filesystem>
#include <regex>

#include "agent/InstallerSettings.h"
#include "platform/linux/DataFolder.h"
#include "platform/linux/GettextStringTable.h"
#include "tests/package/HelpText.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::Not;

constexpr const char* kLanguages[] = {"de", "fr"};

fs::path po(const std::string& name) {
    return fs::path(VENTRAS_PO) / name;
}

/// The catalogue of the texts that the sources have now.
class Translations : public testing::Test {
protected:
    void SetUp() override {
        const auto made = runProgram({po("update"), folder_.path()});
        ASSERT_EQ(made.exitStatus, 0) << made.standardError;
    }

    TemporaryFolder folder_;
};

TEST_F(Translations, AreThereForEachText) {
    for (const std::string language : kLanguages) {
        const auto compared = runProgram({"msgcmp", po(language + ".po"), folder_ / "browser.pot"});
        EXPECT_EQ(compared.exitStatus, 0) << compared.standardError;
    }
}

TEST_F(Translations, AreWellFormedAndNotInDoubt) {
    for (const std::string language : kLanguages) {
        const auto made =
            runProgram({"msgfmt", "--check", "--statistics", "-o", folder_ / "x.mo", po(language + ".po")},
                       {.environment = {{"LC_ALL", "C"}, {"LANGUAGE", ""}}});
        EXPECT_EQ(made.exitStatus, 0) << made.standardError;
        EXPECT_THAT(made.standardError, Not(HasSubstr("fuzzy"))) << language;
        EXPECT_THAT(made.standardError, Not(HasSubstr("untranslated"))) << language;
    }
}

TEST_F(Translations, AreMadeFromTheTextsOfTheSources) {
    const auto texts = [](const fs::path& file) { return matchesOf(readFile(file), "\nmsgid \"(.+)\"\n"); };
    EXPECT_EQ(texts(po("browser.pot")), texts(folder_ / "browser.pot"))
        << "data/po/update brings it up to date";
}

TEST_F(Translations, HaveAPlaceForTheSameValues) {
    const std::regex entry("msgid \"(.+)\"\nmsgstr \"(.+)\"\n");
    const auto isValued = [](const std::string& text) { return text.find("%@") != std::string::npos; };
    for (const std::string language : kLanguages) {
        const auto catalogue = readFile(po(language + ".po"));
        std::size_t valued = 0;
        for (std::sregex_iterator at(catalogue.begin(), catalogue.end(), entry), end; at != end; ++at) {
            EXPECT_EQ(isValued((*at)[1]), isValued((*at)[2])) << (*at)[0];
            valued += isValued((*at)[1]) ? 1U : 0U;
        }
        EXPECT_GT(valued, 5U);
    }
}

TEST_F(Translations, OfConstantsAreOfTextsThatTheSourcesHave) {
    std::string sources;
    for (const char* folder : {"agent", "platform/linux"})
        for (const auto& entry : fs::recursive_directory_iterator(fs::path(VENTRAS_SOURCES) / folder))
            if (entry.path().extension() == ".cpp")
                sources += readFile(entry.path());
    const auto texts = matchesOf(readFile(po("constants.h")), "\ntranslatable\\((\".+\")\\)");
    EXPECT_FALSE(texts.empty());
    for (const auto& text : texts)
        EXPECT_NE(sources.find(text), std::string::npos) << text;
}

std::string helpIn(const std::string& language) {
    return runProgram({VENTRAS_TOOL, "--help"},
                      {.environment = {{"LC_ALL", "C.UTF-8"}, {"LANGUAGE", language}}})
        .standardOutput;
}

TEST(Translation, IsWhatTheToolSpeaks) {
    EXPECT_THAT(helpIn("de"), HasSubstr("Aufruf: ventrasctl [OPTION]"));
    EXPECT_THAT(helpIn("de"), HasSubstr("was eine PPD-Datei besagt"));
    EXPECT_THAT(helpIn("fr"), HasSubstr("ce que dit un fichier PPD"));
    EXPECT_THAT(helpIn("xx:de"), HasSubstr("Aufruf:"));
    EXPECT_THAT(helpIn(""), HasSubstr("what a PPD file says"));
}

TEST(Translation, LeavesJsonAsItIs) {
    const auto say = [](const std::string& language, std::vector<std::string> arguments) {
        arguments.insert(arguments.begin(), VENTRAS_TOOL);
        return runProgram(arguments, {.environment = {{"LC_ALL", "C.UTF-8"}, {"LANGUAGE", language}}})
            .standardOutput;
    };
    const std::vector<std::string> command{"device-id", "MFG:HP;MDL:LaserJet;CMD:PCL;"};
    EXPECT_THAT(say("de", command), HasSubstr("ja"));
    auto json = command;
    json.emplace_back("--json");
    EXPECT_EQ(say("de", json), say("", json));
    EXPECT_THAT(say("de", json), HasSubstr("\"supportsPCL\""));
}

TEST(Translation, IsWhatTheAgentAsksIn) {
    setenv("LC_ALL", "C.UTF-8", 1);
    setenv("LANGUAGE", "de", 1);
    const GettextStringTable texts(locateDataFolder().parent_path() / "locale");
    const auto settings = installerSettings(texts, DataFolder("/nonexistent"));
    const auto title = promptTitle(texts, {});
    unsetenv("LANGUAGE");
    unsetenv("LC_ALL");
    EXPECT_EQ(settings.noNetworkTitle, "Keine Verbindung zum Internet möglich.");
    EXPECT_EQ(title, "Möchten Sie Software für Ihre Drucker installieren?");
}

}  // namespace
}  // namespace ventras
