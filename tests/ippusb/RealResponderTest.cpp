#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <future>
#include <thread>

#include "devices/TXTQuery.h"
#include "platform/ServiceRecord.h"
#include "platform/linux/options/LocalServiceResolver.h"
#include "tests/responder/PrivateResponder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Dictionary = std::optional<DeviceDescription>;

struct Answer {
    Dictionary dictionary;
    std::chrono::milliseconds time;
};

Answer ask(const std::string& name) {
    const auto start = std::chrono::steady_clock::now();
    auto dictionary = queryTXTRecord(name);
    const auto time = std::chrono::steady_clock::now() - start;
    return {std::move(dictionary), std::chrono::duration_cast<std::chrono::milliseconds>(time)};
}

constexpr const char* kNames[] = {
    "Laser",
    "Laser 9 (USB)",
    "dots.in.the.name.",
    "a/b/c",
    "say \"hi\", 'you' & me",
    "back\\slash",
    "B\xc3\xbcro \xe6\x97\xa5\xe6\x9c\xac",
    "100% #1 @ home?",
    "_ipp._tcp.local.",
    "a very long name that has exactly sixty-three bytes in it all!!",
};

TEST(RealResponder, KnowsServicesOfAnyName) {
    PrivateResponder responder;
    std::uint16_t port = 1000;
    for (const auto* name : kNames)
        responder.publish({.name = name, .port = ++port, .txt = txtRecord({"note=" + std::to_string(port)})});
    port = 1000;
    for (const auto* name : kNames)
        EXPECT_EQ(ask(name).dictionary, (DeviceDescription{{"note", std::to_string(++port)}})) << name;
}

TEST(RealResponder, MatchesNamesWithoutRegardToCase) {
    PrivateResponder responder;
    responder.publish({.name = "Laser", .txt = txtRecord({"rp=x"})});
    EXPECT_EQ(ask("LASER").dictionary, (DeviceDescription{{"rp", "x"}}));
}

struct RecordCase {
    const char* what;
    std::string record;
    DeviceDescription expected;
};

const RecordCase kRecords[] = {
    {"no items", std::string(1, '\0'), {}},
    {"an empty value", txtRecord({"rp=", "note=x"}), {{"note", "x"}}},
    {"a key without value", txtRecord({"rp", "note=x"}), {{"note", "x"}}},
    {"a key of 253 bytes", txtRecord({std::string(253, 'k') + "=v"}), {{std::string(253, 'k'), "v"}}},
    {"a key of 255 bytes", txtRecord({std::string(255, 'k'), "note=x"}), {{"note", "x"}}},
    {"a value as long as can be", txtRecord({"k=" + std::string(253, 'v')}), {{"k", std::string(253, 'v')}}},
    {"a value that is no UTF-8", txtRecord({"rp=\xff\xfe", "note=x"}), {{"note", "x"}}},
    {"one key twice", txtRecord({"note=x", "note=y"}), {{"note", "y"}}},
    {"no key", txtRecord({"=x", "note=y"}), {{"", "x"}, {"note", "y"}}},
};

TEST(RealResponder, HandsOnWhatEverIsInARecord) {
    PrivateResponder responder;
    for (const auto& [what, record, expected] : kRecords)
        responder.publish({.name = what, .txt = record});
    for (const auto& [what, record, expected] : kRecords)
        EXPECT_EQ(ask(what).dictionary, expected) << what;
}

TEST(RealResponder, KeepsSilentAboutServicesThatItDoesNotKnow) {
    PrivateResponder responder;
    responder.publish({.name = "Laser"});
    const auto answer = ask("Other");
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_GE(answer.time, 2900ms);
    EXPECT_LE(answer.time, 3500ms);
}

TEST(RealResponder, KeepsSilentAboutAServiceWithoutTXTRecord) {
    PrivateResponder responder;
    responder.publish({.name = "Bare", .port = 631, .txt = std::nullopt});
    EXPECT_EQ(ask("Bare").dictionary, std::nullopt);
    const auto service = resolveLocalService("Bare");
    ASSERT_TRUE(service);
    EXPECT_EQ(service->port, 631);
    EXPECT_EQ(service->printResource, "");
}

TEST(RealResponder, AnswersManyQuestionsAtOnce) {
    PrivateResponder responder;
    responder.publish({.name = "Laser", .txt = txtRecord({"rp=x"})});
    std::vector<std::future<Answer>> answers;
    for (int i = 0; i < 32; ++i)
        answers.push_back(std::async(std::launch::async, ask, "Laser"));
    for (auto& answer : answers)
        EXPECT_EQ(answer.get().dictionary, (DeviceDescription{{"rp", "x"}}));
}

TEST(RealResponder, HasQuestionsEndInTimeWhileItHangs) {
    PrivateResponder responder;
    responder.publish({.name = "Laser"});
    responder.suspend();
    const auto answer = ask("Laser");
    EXPECT_EQ(answer.dictionary, std::nullopt);
    EXPECT_LE(answer.time, 3500ms);
    responder.resume();
    EXPECT_EQ(ask("Laser").dictionary, DeviceDescription{});
}

TEST(RealResponder, HasAQuestionEndWhenItGoesAwayMeanwhile) {
    for (void (PrivateResponder::*end)() : {&PrivateResponder::kill, &PrivateResponder::killBus}) {
        PrivateResponder responder;
        auto answer = std::async(std::launch::async, ask, "Other");
        std::this_thread::sleep_for(500ms);
        (responder.*end)();
        EXPECT_EQ(answer.get().dictionary, std::nullopt);
    }
}

TEST(RealResponder, HasQuestionsEndAtOnceWhenItIsNotThere) {
    for (void (PrivateResponder::*end)() : {&PrivateResponder::kill, &PrivateResponder::killBus}) {
        PrivateResponder responder;
        (responder.*end)();
        const auto answer = ask("Laser");
        EXPECT_EQ(answer.dictionary, std::nullopt);
        EXPECT_LE(answer.time, 1000ms);
    }
}

std::ptrdiff_t openDescriptors() {
    return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {});
}

TEST(RealResponder, IsLeftWithoutATraceByQuestions) {
    PrivateResponder responder;
    responder.publish({.name = "Laser"});
    ask("Laser");
    const auto before = openDescriptors();
    for (int i = 0; i < 20; ++i)
        ask("Laser");
    EXPECT_EQ(openDescriptors(), before);
}

TEST(RealResponder, IsAskedWithoutAWordOnStandardError) {
    PrivateResponder responder;
    responder.publish({.name = "Laser"});
    testing::internal::CaptureStderr();
    ask("Laser");
    resolveLocalService("Laser");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(RealResponder, NamesPortResourcesAndUUIDOfAService) {
    PrivateResponder responder;
    responder.publish(
        {.name = "Laser", .port = 60001, .txt = txtRecord({"RP=ipp/print", "rfo=ipp/faxout", "UUID=ab"})});
    const auto service = resolveLocalService("Laser");
    ASSERT_TRUE(service);
    EXPECT_EQ(service->port, 60001);
    EXPECT_EQ(service->printResource, "ipp/print");
    EXPECT_EQ(service->faxResource, "ipp/faxout");
    EXPECT_EQ(service->uuid, "ab");
}

TEST(RealResponder, NamesNoServiceThatIsRegisteredWithoutAPort) {
    PrivateResponder responder;
    responder.publish({.name = "Laser", .port = 0});
    EXPECT_FALSE(resolveLocalService("Laser"));
    EXPECT_FALSE(resolveLocalService(std::string(64, 'x')));
}

}  // namespace
}  // namespace ventras
