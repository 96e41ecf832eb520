#include <gtest/gtest.h>

#include <thread>

#include "platform/linux/desktop/DBusPrintToolAgentChannel.h"
#include "tests/catalogue/CatalogueTexts.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/parts/ComesTrue.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const std::string kLaserJet4 = "MANUFACTURER:HP;MODEL:LaserJet 4";

/// The service as a process on a bus of its own, with the small catalogue, asked the way the agent asks.
class RunningAgentService : public testing::Test {
protected:
    RunningAgentService() { data_.write("driver-packages.plist", smallCatalogue("other 1")); }

    Environment environment() const {
        auto environment = bus_.environment();
        environment.emplace("VENTRAS_DATA_DIR", data_.path().string());
        return environment;
    }

    RunningProgram start(const std::string& idleLimit) {
        return RunningProgram({VENTRAS_TEST_CATALOGUE_AGENT, "--idle-limit=" + idleLimit},
                              {.environment = environment()});
    }

    static PrintToolAgentReply ask(const PropertyDictionary& arguments, std::int32_t command = 1) {
        return DBusPrintToolAgentChannel().sendCommandSync(PrintToolAgentChannel::kService, command,
                                                           arguments);
    }

    /// The first answer once the service is there.
    static PrintToolAgentReply askUntilAnswered(const PropertyDictionary& arguments) {
        PrintToolAgentReply reply;
        const auto isAnswered = [&] {
            reply = ask(arguments);
            return reply.status == 0;
        };
        comesTrue(isAnswered, 5s);
        return reply;
    }

    TemporaryFolder data_;
    PrivateBus bus_;
};

TEST_F(RunningAgentService, AnswersTheAgentsQuestion) {
    auto service = start("20000");
    const auto reply = askUntilAnswered({{"scanID", kLaserJet4}, {"Vellum", true}});
    EXPECT_EQ(reply.status, 0);
    EXPECT_EQ(packageCount(reply), 1);
    EXPECT_EQ(reply.dictionary,
              (PropertyDictionary{{"count", std::int64_t{1}}, {"is_cache_current", false}}));
    const auto conflicting = ask({{"scanID", "MANUFACTURER:HP;MODEL:LaserJet 6"}});
    EXPECT_EQ(packageCount(conflicting), 2);
    EXPECT_TRUE(conflicting.dictionary.contains("conflicts"));
}

TEST_F(RunningAgentService, GivesAStatusForWhatMakesNoSenseAndGoesOn) {
    auto service = start("20000");
    askUntilAnswered({{"scanID", kLaserJet4}});
    EXPECT_NE(ask({{"scanID", kLaserJet4}}, 7).status, 0);
    EXPECT_NE(ask({}).status, 0);
    EXPECT_NE(ask({{"scanID", PropertyArray{}}}).status, 0);
    EXPECT_NE(ask({{"scanID", std::string(1'000'000, 'x')}}).status, 0);
    EXPECT_EQ(ask({{"scanID", kLaserJet4}}).status, 0);
}

TEST_F(RunningAgentService, EndsWhenNobodyAsks) {
    auto service = start("300");
    EXPECT_TRUE(service.waitUntilEnded(20s));
    EXPECT_EQ(service.result().exitStatus, 0) << service.standardError();
}

TEST_F(RunningAgentService, StaysAsLongAsSomebodyAsks) {
    auto service = start("2000");
    askUntilAnswered({{"scanID", kLaserJet4}});
    for (int i = 0; i < 8; ++i) {
        std::this_thread::sleep_for(500ms);
        EXPECT_EQ(ask({{"scanID", kLaserJet4}}).status, 0) << i;
    }
    EXPECT_TRUE(service.waitUntilEnded(20s));
}

TEST_F(RunningAgentService, LeavesTheNameToWhoHasIt) {
    auto first = start("20000");
    askUntilAnswered({{"scanID", kLaserJet4}});
    auto second = start("20000");
    EXPECT_TRUE(second.waitUntilEnded(20s));
    EXPECT_EQ(second.result().exitStatus, 1);
    EXPECT_TRUE(first.isRunning());
}

TEST_F(RunningAgentService, EndsWithTheBus) {
    auto service = start("60000");
    askUntilAnswered({{"scanID", kLaserJet4}});
    bus_.stop();
    EXPECT_TRUE(service.waitUntilEnded(20s));
}

TEST_F(RunningAgentService, EndsWhereTheBusHangs) {
    bus_.suspend();
    auto service = start("300");
    EXPECT_TRUE(service.waitUntilEnded(25s));
    EXPECT_EQ(service.result().exitStatus, 1) << service.standardError();
    bus_.resume();
}

TEST_F(RunningAgentService, KnowsNoPackageWithoutACatalogue) {
    std::filesystem::remove(data_ / "driver-packages.plist");
    auto service = start("20000");
    const auto reply = askUntilAnswered({{"scanID", kLaserJet4}});
    EXPECT_EQ(reply.dictionary,
              (PropertyDictionary{{"count", std::int64_t{0}}, {"is_cache_current", false}}));
}

TEST(AgentServiceProgram, NeedsABusAndProperArguments) {
    const Environment noBus{{"DBUS_SESSION_BUS_ADDRESS", "unix:path=/does/not/exist"}};
    EXPECT_EQ(runProgram({VENTRAS_TEST_CATALOGUE_AGENT}, {.environment = noBus}).exitStatus, 1);
    for (const std::string argument : {"--idle-limit=", "--idle-limit=x", "--idle-limit=-1", "--other", ""})
        EXPECT_EQ(runProgram({VENTRAS_TEST_CATALOGUE_AGENT, argument}, {.environment = noBus}).exitStatus, 2)
            << argument;
}

TEST(AgentServiceActivation, IsStartedByTheBusThatReadsItsServiceFile) {
    const TemporaryFolder data;
    auto service = readFile(VENTRAS_TEST_SERVICE_FILE);
    const std::string placeholder = "@CMAKE_INSTALL_FULL_LIBEXECDIR@/ventras-catalogue-agent";
    const auto program = service.find(placeholder);
    ASSERT_NE(program, std::string::npos) << service;
    service.replace(program, placeholder.size(),
                    std::string(VENTRAS_TEST_CATALOGUE_AGENT) + " --idle-limit=500");
    data.write("dbus-1/services/com.quillon.lorvextool.agent.service", service);
    data.write("driver-packages.plist", smallCatalogue());
    const auto call = runProgram(
        {"dbus-run-session", "--", "gdbus", "call", "--session", "--dest", "com.quillon.lorvextool.agent",
         "--object-path", "/com/quillon/lorvextool/agent", "--method", "com.quillon.lorvextool.agent.Command",
         "1", "{'scanID': <'MANUFACTURER:HP;MODEL:LaserJet 5'>}"},
        {.environment = {{"XDG_DATA_DIRS", data.path().string()},
                         {"VENTRAS_DATA_DIR", data.path().string()}}});
    EXPECT_EQ(call.exitStatus, 0) << call.standardError;
    EXPECT_NE(call.standardOutput.find("'count': <int64 1>"), std::string::npos) << call.standardOutput;
}

}  // namespace
}  // namespace ventras
