#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>

#include "platform/linux/desktop/DBusCall.h"
#include "platform/linux/desktop/DBusNotificationBroadcast.h"
#include "platform/linux/desktop/DBusPrintToolAgentChannel.h"
#include "platform/linux/desktop/LinuxComputerName.h"
#include "platform/linux/desktop/PropertyVariant.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/platform-linux/FakeBusService.h"
#include "tests/platform-linux/PostedNotifications.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Clock = std::chrono::steady_clock;

constexpr DBusMethod kGetId{Bus::System, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                            "org.freedesktop.DBus", "GetId"};

TEST(DBusCall, BringsAnAnswer) {
    const PrivateBus bus;
    const auto answer = callDBus(kGetId, g_variant_new("()"), "(s)", 5s);
    ASSERT_TRUE(answer.reply) << answer.failure;
    EXPECT_EQ(answer.failure, "");
}

TEST(DBusCall, FailsAtOnceWithoutABus) {
    ASSERT_EQ(setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1), 0);
    const auto start = Clock::now();
    const auto answer = callDBus(kGetId, g_variant_new("()"), "(s)", 5s);
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    EXPECT_FALSE(answer.reply);
    EXPECT_NE(answer.failure, "");
    EXPECT_LT(Clock::now() - start, 1s);
}

TEST(DBusCall, LooksForNoSessionBusWhereThereIsNone) {
    ASSERT_EQ(unsetenv("DBUS_SESSION_BUS_ADDRESS"), 0);
    ASSERT_EQ(setenv("XDG_RUNTIME_DIR", "/nonexistent", 1), 0);
    auto method = kGetId;
    method.bus = Bus::Session;
    EXPECT_EQ(callDBus(method, g_variant_new("()"), "(s)", 5s).failure, "there is no session bus");
    unsetenv("XDG_RUNTIME_DIR");
}

TEST(DBusCall, FailsWhenTheAnswerIsOfAnotherType) {
    const PrivateBus bus;
    const auto answer = callDBus(kGetId, g_variant_new("()"), "(u)", 5s);
    EXPECT_FALSE(answer.reply);
    EXPECT_NE(answer.failure, "");
}

TEST(DBusCall, FailsAtOnceWhenNobodyHasTheName) {
    const PrivateBus bus;
    const auto start = Clock::now();
    const auto answer = callDBus({Bus::System, "com.example.Nobody", "/x", "com.example.Nobody", "Hello"},
                                 g_variant_new("()"), "()", 5s);
    EXPECT_FALSE(answer.reply);
    EXPECT_LT(Clock::now() - start, 1s);
}

TEST(DBusCall, GivesUpOnABusThatHangs) {
    PrivateBus bus;
    bus.suspend();
    const auto start = Clock::now();
    const auto answer = callDBus(kGetId, g_variant_new("()"), "(s)", 300ms);
    EXPECT_FALSE(answer.reply);
    EXPECT_GE(Clock::now() - start, 250ms);
    EXPECT_LT(Clock::now() - start, 3s);
    bus.resume();
}

TEST(DBusCall, GivesUpOnAServiceThatHangs) {
    const PrivateBus bus;
    const FakeBusService service("com.example.Slow", "/x", "com.example.Slow", "<method name='Hello'/>",
                                 [](const auto&, GVariant*) -> GVariant* { return nullptr; });
    const auto start = Clock::now();
    EXPECT_FALSE(callDBus({Bus::System, "com.example.Slow", "/x", "com.example.Slow", "Hello"},
                          g_variant_new("()"), "()", 300ms)
                     .reply);
    EXPECT_LT(Clock::now() - start, 3s);
}

const PropertyDictionary kDictionary{
    {"flag", true},
    {"number", std::int64_t{-5}},
    {"text", "Caf\xC3\xA9"},
    {"list", PropertyArray{std::int64_t{1}, "two", PropertyArray{}}},
    {"inner", PropertyDictionary{{"key", "value"}}},
    {"empty", PropertyDictionary{}},
};

TEST(PropertyVariant, BringsADictionaryThereAndBack) {
    const VariantPtr variant{g_variant_ref_sink(variantFromDictionary(kDictionary))};
    EXPECT_STREQ(g_variant_get_type_string(variant.get()), "a{sv}");
    EXPECT_EQ(dictionaryFromVariant(variant.get()), kDictionary);
}

TEST(PropertyVariant, MendsBrokenUtf8) {
    const VariantPtr variant{g_variant_ref_sink(variantFromDictionary({{"a\xFF", "b\xFE"}}))};
    EXPECT_EQ(dictionaryFromVariant(variant.get()), (PropertyDictionary{{"a\xEF\xBF\xBD", "b\xEF\xBF\xBD"}}));
}

TEST(PropertyVariant, ReadsAllIntegersAndLeavesOutWhatItCannotHold) {
    const VariantPtr variant{g_variant_ref_sink(g_variant_new_parsed(
        "{'y': <byte 1>, 'n': <int16 -2>, 'q': <uint16 3>, 'i': <-4>, 'u': <uint32 5>, 't': <uint64 6>, "
        "'d': <1.5>, 'o': <objectpath '/x'>, 'as': <['a', 'b']>, 'v': <<true>>}"))};
    EXPECT_EQ(dictionaryFromVariant(variant.get()), (PropertyDictionary{{"y", std::int64_t{1}},
                                                                        {"n", std::int64_t{-2}},
                                                                        {"q", std::int64_t{3}},
                                                                        {"i", std::int64_t{-4}},
                                                                        {"u", std::int64_t{5}},
                                                                        {"t", std::int64_t{6}},
                                                                        {"as", PropertyArray{"a", "b"}},
                                                                        {"v", true}}));
}

constexpr auto kCommandXml =
    "<method name='Command'><arg type='u' direction='in'/><arg type='a{sv}' direction='in'/>"
    "<arg type='a{sv}' direction='out'/></method>";

TEST(PrintToolAgentChannel, SendsACommandAndBringsTheReply) {
    const PrivateBus bus;
    std::string asked;
    const FakeBusService agent(
        "com.quillon.lorvextool.agent", "/com/quillon/lorvextool/agent", "com.quillon.lorvextool.agent",
        kCommandXml, [&asked](const auto&, GVariant* arguments) {
            const GTextPtr text{g_variant_print(arguments, FALSE)};
            asked = text.get();
            return g_variant_new_parsed("({'count': <int64 1>, 'is_cache_current': <true>},)");
        });
    DBusPrintToolAgentChannel channel;
    const auto reply = channel.sendCommandSync(
        PrintToolAgentChannel::kService, PrintToolAgentChannel::kCountDriverPackages, {{"scanID", "MFG:A;"}});
    EXPECT_EQ(reply.status, 0);
    EXPECT_EQ(reply.dictionary, (PropertyDictionary{{"count", std::int64_t{1}}, {"is_cache_current", true}}));
    EXPECT_EQ(asked, "(1, {'scanID': <'MFG:A;'>})");
}

TEST(PrintToolAgentChannel, FailsAtOnceWithoutTheService) {
    const PrivateBus bus;
    DBusPrintToolAgentChannel channel;
    const auto start = Clock::now();
    EXPECT_NE(channel.sendCommandSync(PrintToolAgentChannel::kService, 1, {}).status, 0);
    EXPECT_LT(Clock::now() - start, 1s);
}

TEST(PrintToolAgentChannel, FailsForANameThatNoServiceCanHave) {
    const PrivateBus bus;
    DBusPrintToolAgentChannel channel;
    for (const auto* name : {"", "noDots", "a..b", "with space.x", "a/b.c", "\xFF.x"})
        EXPECT_NE(channel.sendCommandSync(name, 1, {}).status, 0) << name;
}

TEST(NotificationBroadcast, ReachesWhoeverListens) {
    const PrivateBus bus;
    PostedNotifications posted;
    FakeLog log;
    DBusNotificationBroadcast broadcast(log);
    broadcast.post("skerrowed-notification", {{"1284 DeviceID", "MFG:A;"}, {"Match", std::int64_t{2}}});
    EXPECT_THAT(posted.heard(1),
                ElementsAre("('skerrowed-notification', {'1284 DeviceID': <'MFG:A;'>, 'Match': <int64 2>})"));
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST(NotificationBroadcast, LogsWhatItCannotPost) {
    ASSERT_EQ(setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1), 0);
    FakeLog log;
    DBusNotificationBroadcast(log).post("skerrowed-notification", {});
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    EXPECT_THAT(log.lines(), ElementsAre(HasSubstr("skerrowed-notification")));
}

/// A host-name service with one pretty name.
class HostnameService {
public:
    explicit HostnameService(std::string name)
        : service_("org.freedesktop.hostname1", "/org/freedesktop/hostname1", "org.freedesktop.hostname1",
                   "<property name='PrettyHostname' type='s' access='read'/>",
                   [name = std::move(name)](const auto&, GVariant*) {
                       return g_variant_new_string(name.c_str());
                   }) {}

private:
    FakeBusService service_;
};

/// A folder with the files that describe a computer.
struct ComputerFiles {
    TemporaryFolder folder;

    explicit ComputerFiles(std::string_view machineInfo, std::string_view hostname = "static-name\n") {
        folder.write("machine-info", machineInfo);
        folder.write("hostname", hostname);
    }

    std::optional<std::string> name() const { return LinuxComputerName(folder.path()).computerName(); }
};

TEST(ComputerName, IsThePrettyNameOfTheHostNameService) {
    const PrivateBus bus;
    const HostnameService service("Anna's \"Office\"");
    EXPECT_EQ(ComputerFiles("PRETTY_HOSTNAME=Other\n").name(), "Anna's \"Office\"");
}

TEST(ComputerName, IsInTheMachinesFileWhenTheServiceHasNone) {
    const PrivateBus bus;
    const HostnameService service("");
    EXPECT_EQ(ComputerFiles("PRETTY_HOSTNAME=\"Reading Room\"\n").name(), "Reading Room");
}

TEST(ComputerName, NeedsNoBus) {
    ASSERT_EQ(setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1), 0);
    EXPECT_EQ(ComputerFiles("PRETTY_HOSTNAME=\"Reading Room\"\n").name(), "Reading Room");
    EXPECT_EQ(ComputerFiles("").name(), "static-name");
    EXPECT_EQ(ComputerFiles("PRETTY_HOSTNAME=\n").name(), "static-name");
    EXPECT_EQ(ComputerFiles("PRETTY_HOSTNAME=\"a\x01"
                            "b\"\n")
                  .name(),
              "static-name");
    std::string kernelName(256, '\0');
    ASSERT_EQ(gethostname(kernelName.data(), kernelName.size()), 0);
    kernelName.resize(kernelName.find_first_of(std::string(".\0", 2)));
    EXPECT_EQ(ComputerFiles("", "").name(), kernelName);
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
}

TEST(ComputerName, IsLookedUpOnce) {
    const PrivateBus bus;
    ComputerFiles files("PRETTY_HOSTNAME=First\n");
    LinuxComputerName name(files.folder.path());
    EXPECT_EQ(name.computerName(), "First");
    files.folder.write("machine-info", "PRETTY_HOSTNAME=Second\n");
    EXPECT_EQ(name.computerName(), "First");
}

struct AssignmentCase {
    std::string_view file;
    std::optional<std::string> value;
};
const AssignmentCase kAssignments[] = {
    {"KEY=plain", "plain"},
    {"KEY=\"double quoted\"", "double quoted"},
    {"KEY='single $quoted'", "single $quoted"},
    {"KEY=\"Anna's \\\"Office\\\"\"", "Anna's \"Office\""},
    {"KEY='a\\b'", "a\\b"},
    {"OTHER=x\nKEY=y\n", "y"},
    {"KEY=x\nKEY=y\n", "y"},
    {"  KEY=x  \r\n", "x"},
    {"# KEY=x", std::nullopt},
    {"MYKEY=x", std::nullopt},
    {"KEYS=x", std::nullopt},
    {"KEY", std::nullopt},
    {"KEY=", std::nullopt},
    {"KEY=\"\"", std::nullopt},
    {"", std::nullopt},
};

TEST(ShellAssignment, IsReadAsAShellWouldReadIt) {
    for (const auto& [file, value] : kAssignments)
        EXPECT_EQ(shellAssignment(file, "KEY"), value) << file;
}

}  // namespace
}  // namespace ventras
