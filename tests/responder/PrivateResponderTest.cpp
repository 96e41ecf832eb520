#include "tests/responder/PrivateResponder.h"

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <stdexcept>
#include <thread>

#include "platform/ServiceRecord.h"
#include "tests/parts/SchedulerFolder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

std::optional<std::string> txtOf(const std::string& name) {
    return queryLocalServiceRecord(*ippServiceFullName(name), ServiceRecordType::TXT);
}

TEST(PrivateResponder, AnswersForAServiceAsSoonAsItIsPublished) {
    PrivateResponder responder;
    const auto txt = txtRecord({"rp=ipp/print", "note="});
    responder.publish({.name = "Laser", .txt = txt});
    EXPECT_EQ(txtOf("Laser"), txt);
}

TEST(PrivateResponder, ForgetsServicesThatAreWithdrawn) {
    PrivateResponder responder;
    responder.publish({.name = "Laser"});
    responder.withdrawAll();
    std::this_thread::sleep_for(2s);  // the rest of a withdrawn record's life
    EXPECT_EQ(txtOf("Laser"), std::nullopt);
}

TEST(PrivateResponder, RefusesNamesThatNoServiceCanHave) {
    PrivateResponder responder;
    EXPECT_THROW(responder.publish({.name = ""}), std::runtime_error);
    EXPECT_THROW(responder.publish({.name = std::string(64, 'x')}), std::runtime_error);
}

TEST(PrivateResponder, ComesAnewInOneProcess) {
    for (int i = 0; i < 3; ++i) {
        PrivateResponder responder;
        responder.publish({.name = "Laser", .txt = txtRecord({"n=" + std::to_string(i)})});
        EXPECT_EQ(txtOf("Laser"), txtRecord({"n=" + std::to_string(i)}));
    }
}

TEST(PrivateResponder, WorksForAnOrdinaryUserToo) {
    const TemporaryFolder folder;  // which that user can read, wherever this program lies
    const auto program = folder / "test";
    std::filesystem::copy_file("/proc/self/exe", program);
    const auto result = runProgram({program, "--gtest_filter=*AsSoonAsItIsPublished"},
                                   {.environment = {{"VENTRAS_OWN_NETWORK", ""}}, .user = ordinaryUser()});
    EXPECT_EQ(result.exitStatus, 0) << result.standardOutput << result.standardError;
}

}  // namespace
}  // namespace ventras
