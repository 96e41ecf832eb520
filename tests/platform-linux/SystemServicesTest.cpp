#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <thread>

#include "platform/PropertyList.h"
#include "platform/linux/DataFolder.h"
#include "platform/linux/GettextStringTable.h"
#include "platform/linux/LinuxPlatform.h"
#include "platform/linux/PlistPreferenceStore.h"
#include "platform/linux/ProcProcessTable.h"
#include "platform/linux/Syslog.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/ComesTrue.h"
#include "tests/parts/Program.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

struct LineCase {
    std::string text, line;
};
const LineCase kLines[] = {
    {"plain text", "plain text"},
    {"Caf\xC3\xA9", "Caf\xC3\xA9"},
    {"two\nlines\r\ttab", "two\\x0Alines\\x0D\\x09tab"},
    {"\x1B[2Jclear", "\\x1B[2Jclear"},
    {"\x7F", "\\x7F"},
    {"\xC2\x85", "\\xC2\\x85"},
    {"broken \xFF\xC3", "broken \\xFF\\xC3"},
    {std::string("nul\0x", 5), "nul\\x00x"},
    {"%s%n", "%s%n"},
    {"", ""},
};

TEST(HarmlessLine, ShowsControlCharactersAsNumbers) {
    for (const auto& [text, line] : kLines)
        EXPECT_EQ(harmlessLine(text), line);
}

TEST(Syslog, KeepsOffAStandardErrorThatNobodyOfItsOwnReads) {
    testing::internal::CaptureStderr();
    Syslog().error("something failed");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(Syslog, WritesToTheStreamOfAServiceManager) {
    testing::internal::CaptureStderr();
    struct stat status {};
    ASSERT_EQ(fstat(STDERR_FILENO, &status), 0);
    const auto stream = std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
    setenv("JOURNAL_STREAM", stream.c_str(), 1);
    Syslog().error("something\nfailed");
    setenv("JOURNAL_STREAM", "1:2", 1);
    Syslog().error("elsewhere");
    unsetenv("JOURNAL_STREAM");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "ventrasagent: something\\x0Afailed\n");
}

TEST(ProcProcessTable, FindsAProcessByItsExactName) {
    const TemporaryFolder folder;
    const auto program = folder / "lin-sleeper";
    std::filesystem::create_symlink("/bin/sleep", program);
    RunningProgram sleeper({program.string(), "30"});
    ProcProcessTable table;
    comesTrue([&] { return table.processNamed("lin-sleeper").has_value(); }, 2s);
    EXPECT_EQ(table.processNamed("lin-sleeper"), sleeper.pid());
    EXPECT_EQ(table.processNamed("lin-sleepe"), std::nullopt);
    EXPECT_EQ(table.processNamed("LIN-SLEEPER"), std::nullopt);
    sleeper.end();
    EXPECT_EQ(table.processNamed("lin-sleeper"), std::nullopt);
}

TEST(ProcProcessTable, LooksAtProcessesOnly) {
    const TemporaryFolder folder;
    folder.write("12/comm", "cupsd\n");
    folder.write("self/comm", "other\n");
    folder.write("13/comm", "sleep\n");
    folder.write("14x/comm", "odd\n");
    ProcProcessTable table(folder.path());
    EXPECT_EQ(table.processNamed("cupsd"), 12);
    EXPECT_EQ(table.processNamed("other"), std::nullopt);
    EXPECT_EQ(table.processNamed("odd"), std::nullopt);
    EXPECT_EQ(table.processNamed(""), std::nullopt);
}

TEST(ProcProcessTable, DoesNotTrustThePlaceWhereAProcessWasFound) {
    const TemporaryFolder folder;
    folder.write("12/comm", "cupsd\n");
    ProcProcessTable table(folder.path());
    EXPECT_EQ(table.processNamed("cupsd"), 12);
    folder.write("12/comm", "another\n");  // its number was given to somebody else
    EXPECT_EQ(table.processNamed("cupsd"), std::nullopt);
    folder.write("7/comm", "cupsd\n");  // it was started again
    EXPECT_EQ(table.processNamed("cupsd"), 7);
    std::filesystem::remove_all(folder / "7");
    EXPECT_EQ(table.processNamed("cupsd"), std::nullopt);
    EXPECT_EQ(table.processNamed("another"), 12);
}

TEST(ProcProcessTable, FindsNothingWithoutProcfs) {
    EXPECT_EQ(ProcProcessTable("/nonexistent").processNamed("cupsd"), std::nullopt);
}

TEST(DataFolder, HasTheResourcesOfTheBuildTree) {
    const DataFolder folder(locateDataFolder());
    for (const auto* name : {"Generic", "Fax", "Vellum"})
        EXPECT_TRUE(folder.pathForResource(name, "ppd")) << name << " in " << folder.name();
    EXPECT_TRUE(folder.pathForResource("NoSerialNumber", "xml"));
}

TEST(DataFolder, IsWhereTheEnvironmentSays) {
    const TemporaryFolder folder;
    const auto path = folder.write("Vellum.ppd", "x");
    setenv("VENTRAS_DATA_DIR", folder.path().c_str(), 1);
    const DataFolder data(locateDataFolder());
    unsetenv("VENTRAS_DATA_DIR");
    EXPECT_EQ(data.pathForResource("Vellum", "ppd"), path.string());
    EXPECT_EQ(data.name(), folder.path().string());
}

TEST(DataFolder, GivesNothingButItsOwnFiles) {
    const TemporaryFolder folder;
    folder.write("data/Vellum.ppd", "x");
    folder.write("secret.ppd", "x");
    std::filesystem::create_directory(folder / "data" / "Folder.ppd");
    const DataFolder data(folder / "data");
    for (const auto* name : {"None", "../secret", "", "Folder", "./Vellum"})
        EXPECT_EQ(data.pathForResource(name, "ppd"), std::nullopt) << name;
    EXPECT_EQ(data.pathForResource("Vellum", ""), std::nullopt);
    EXPECT_EQ(data.pathForResource("Vellum", "../ppd"), std::nullopt);
    EXPECT_EQ(data.pathForResource(std::string_view("Vellum\0x", 8), "ppd"), std::nullopt);
}

TEST(GettextStringTable, LeavesATextWithoutTranslation) {
    const GettextStringTable strings("/nonexistent");
    EXPECT_EQ(strings.localizedString("Software Update"), "Software Update");
    EXPECT_EQ(strings.localizedString(""), "");
}

TEST(GettextStringTable, TranslatesIntoTheUsersLanguage) {
    const TemporaryFolder folder;
    const auto catalogue = folder.write("browser.po",
                                        "msgid \"\"\nmsgstr \"Content-Type: text/plain; charset=UTF-8\\n\"\n"
                                        "msgid \"Printer\"\nmsgstr \"Drucker \xC3\xBC\"\n");
    std::filesystem::create_directories(folder / "de" / "LC_MESSAGES");
    const auto made =
        runProgram({"msgfmt", "-o", (folder / "de/LC_MESSAGES/browser.mo").string(), catalogue.string()});
    ASSERT_EQ(made.exitStatus, 0) << made.standardError;
    setenv("LC_ALL", "C.UTF-8", 1);
    setenv("LANGUAGE", "de", 1);
    const GettextStringTable strings(folder.path());
    const auto text = strings.localizedString("Printer");
    unsetenv("LANGUAGE");
    unsetenv("LC_ALL");
    EXPECT_EQ(text, "Drucker \xC3\xBC");
}

constexpr std::string_view kDomain = "com.quillon.print.ventrasagent";

PropertyDictionary stored(const TemporaryFolder& folder) {
    const auto list = parsePropertyList(readFile(folder / (std::string(kDomain) + ".plist")));
    const auto* dictionary = list ? std::get_if<PropertyDictionary>(&*list) : nullptr;
    return dictionary == nullptr ? PropertyDictionary{} : *dictionary;
}

TEST(PlistPreferenceStore, KeepsValuesUnderTheirKeys) {
    const TemporaryFolder folder;
    FakeLog log;
    PlistPreferenceStore store(folder.path(), log);
    store.setValue(kDomain, "Printers Seen", PropertyArray{"a", "b"});
    store.setValue(kDomain, "Other", true);
    store.setValue(kDomain, "Printers Seen", PropertyArray{"c"});
    EXPECT_EQ(stored(folder), (PropertyDictionary{{"Other", true}, {"Printers Seen", PropertyArray{"c"}}}));
    EXPECT_EQ(store.value(kDomain, "Other"), PropertyValue{true});
    EXPECT_EQ(store.value(kDomain, "None"), std::nullopt);
    EXPECT_EQ(store.value("com.example.none", "Other"), std::nullopt);
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST(PlistPreferenceStore, LeavesNothingBesideItsFile) {
    const TemporaryFolder folder;
    FakeLog log;
    PlistPreferenceStore(folder.path(), log).setValue(kDomain, "Key", "value");
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(folder.path()))
        names.push_back(entry.path().filename());
    EXPECT_THAT(names, ElementsAre("com.quillon.print.ventrasagent.plist"));
}

TEST(PlistPreferenceStore, KeepsAnUnreadableFileAside) {
    const TemporaryFolder folder;
    folder.write("com.quillon.print.ventrasagent.plist", "not a property list");
    FakeLog log;
    PlistPreferenceStore(folder.path(), log).setValue(kDomain, "Key", "value");
    EXPECT_EQ(stored(folder), (PropertyDictionary{{"Key", "value"}}));
    EXPECT_EQ(readFile(folder / "com.quillon.print.ventrasagent.plist.bad"), "not a property list");
}

TEST(PlistPreferenceStore, LeavesAFolderInTheFilesPlaceAlone) {
    const TemporaryFolder folder;
    const auto inside = folder.write("com.quillon.print.ventrasagent.plist/something", "precious");
    FakeLog log;
    PlistPreferenceStore store(folder.path(), log);
    store.setValue(kDomain, "Key", "value");
    EXPECT_EQ(store.value(kDomain, "Key"), std::nullopt);
    EXPECT_EQ(readFile(inside), "precious");
    EXPECT_THAT(log.lines(), ElementsAre(HasSubstr("is not stored: Is a directory")));
}

TEST(PlistPreferenceStore, MakesItsFolder) {
    const TemporaryFolder folder;
    FakeLog log;
    PlistPreferenceStore store(folder / "home" / ".config", log);
    store.setValue(kDomain, "Key", "value");
    EXPECT_EQ(store.value(kDomain, "Key"), PropertyValue{"value"});
}

TEST(PlistPreferenceStore, LogsWhatItCannotStore) {
    FakeLog log;
    PlistPreferenceStore("/proc/nonexistent", log).setValue(kDomain, "Key", "value");
    PlistPreferenceStore("", log).setValue(kDomain, "Key", "value");
    const TemporaryFolder folder;
    PlistPreferenceStore store(folder.path(), log);
    store.setValue(kDomain, "Good", "value");
    store.setValue(kDomain, "Bad", "\x01");
    EXPECT_EQ(log.lines().size(), 3U) << testing::PrintToString(log.lines());
    EXPECT_EQ(stored(folder), (PropertyDictionary{{"Good", "value"}}));
}

TEST(PlistPreferenceStore, LosesNothingWhenTwoAgentsWriteAtOnce) {
    const TemporaryFolder folder;
    FakeLog log;
    {
        std::vector<std::jthread> agents;
        for (int agent = 0; agent < 4; ++agent)
            agents.emplace_back([&, agent] {
                PlistPreferenceStore store(folder.path(), log);
                for (int i = 0; i < 10; ++i)
                    store.setValue(kDomain, std::to_string(agent) + "." + std::to_string(i), true);
            });
    }
    EXPECT_THAT(log.lines(), IsEmpty());
    EXPECT_EQ(stored(folder).size(), 40U);
}

TEST(UserConfigurationFolder, FollowsTheEnvironment) {
    setenv("XDG_CONFIG_HOME", "/some/config", 1);
    EXPECT_EQ(userConfigurationFolder(), "/some/config");
    setenv("XDG_CONFIG_HOME", "relative", 1);
    const std::string home = getenv("HOME") == nullptr ? "" : getenv("HOME");
    setenv("HOME", "/some/home", 1);
    EXPECT_EQ(userConfigurationFolder(), "/some/home/.config");
    unsetenv("XDG_CONFIG_HOME");
    EXPECT_EQ(userConfigurationFolder(), "/some/home/.config");
    unsetenv("HOME");
    EXPECT_TRUE(userConfigurationFolder().is_absolute());
    if (!home.empty())
        setenv("HOME", home.c_str(), 1);
}

TEST(LinuxPlatform, BundlesAllServices) {
    LinuxPlatform linux;
    auto& platform = linux.platform();
    EXPECT_EQ(platform.printSystem.suggestQueueName("A B", false), "A_B");
    EXPECT_TRUE(platform.resources.pathForResource("Vellum", "ppd"));
    const auto browser = platform.makeImageDeviceBrowser();
    browser->setBrowsedDeviceTypeMask(258);
    browser->start();
    EXPECT_EQ(browser->browsedDeviceTypeMask(), 258U);
    EXPECT_THAT(browser->devices(), IsEmpty());
}

}  // namespace
}  // namespace ventras
