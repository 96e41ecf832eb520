#include "platform/linux/scheduler/QueueName.h"

#include <gtest/gtest.h>

#include "platform/Utf8.h"

namespace ventras {
namespace {

struct NameCase {
    std::string text, name;
};
const NameCase kNames[] = {
    {"Laser", "Laser"},
    {"Acme Laser 9000", "Acme_Laser_9000"},
    {"a/b#c", "a_b_c"},
    {"tab\tline\nend", "tab_line_end"},
    {"del\x7f", "del_"},
    {"B\xC3\xBCro", "B\xC3\xBCro"},
    {"c1\xC2\x85"
     "end",
     "c1_end"},                              // U+0085 is a control character
    {"broken\xFF\xFEtail", "broken__tail"},  // one "_" for each byte that is no UTF-8
    {"half\xC3", "half_"},
    {std::string("nul\0!", 5), "nul_!"},
    {"100% (A4) 'x' & ?", "100%_(A4)_'x'_&_?"},
    {"-dash", "-dash"},
    {"///", "___"},
    {"", ""},
};

TEST(QueueName, ReplacesWhatTheSchedulerRefuses) {
    for (const auto& [text, name] : kNames)
        EXPECT_EQ(queueNameFrom(text), name) << text;
}

TEST(QueueName, IsAtMost127BytesLong) {
    EXPECT_EQ(queueNameFrom(std::string(127, 'a')).size(), 127U);
    EXPECT_EQ(queueNameFrom(std::string(128, 'a')), std::string(127, 'a'));
    EXPECT_EQ(queueNameFrom(std::string(10'000, 'a')).size(), 127U);
}

TEST(QueueName, IsCutBetweenCharacters) {
    std::string text(126, 'a');
    EXPECT_EQ(queueNameFrom(text + "\xC3\xBC"), text);
    EXPECT_EQ(queueNameFrom(text + "b\xC3\xBC"), text + "b");
    std::string umlauts;
    for (int i = 0; i < 100; ++i)
        umlauts += "\xC3\xBC";
    EXPECT_EQ(queueNameFrom(umlauts).size(), 126U);
    EXPECT_TRUE(isValidUtf8(queueNameFrom(umlauts)));
}

TEST(UniqueQueueName, IsTheNameItselfWhileItIsFree) {
    EXPECT_EQ(uniqueQueueName("Laser", {}), "Laser");
    EXPECT_EQ(uniqueQueueName("Laser", {"Laser_2", "Lase", "Laser2"}), "Laser");
}

TEST(UniqueQueueName, CountsFromTwoToTheFirstFreeNumber) {
    EXPECT_EQ(uniqueQueueName("Laser", {"Laser"}), "Laser_2");
    EXPECT_EQ(uniqueQueueName("Laser", {"Laser", "Laser_2", "Laser_3"}), "Laser_4");
    EXPECT_EQ(uniqueQueueName("Laser", {"Laser", "Laser_3"}), "Laser_2");
}

TEST(UniqueQueueName, TakesNoNoticeOfCase) {
    EXPECT_EQ(uniqueQueueName("Laser", {"LASER", "laser_2"}), "Laser_3");
}

TEST(UniqueQueueName, StaysWithinTheLimitWithItsSuffix) {
    const std::string longest(127, 'a');
    EXPECT_EQ(uniqueQueueName(longest, {longest}), std::string(125, 'a') + "_2");
    const auto umlaut = std::string(124, 'a') + "\xC3\xBC" + "b";
    EXPECT_EQ(uniqueQueueName(umlaut, {umlaut}),
              std::string(124, 'a') + "_2");  // no half character before it
}

TEST(IsQueueName, AcceptsExactlyWhatNeedsNoReplacement) {
    for (const auto* name : {"Laser", "a?b", "B\xC3\xBCro", "_"})
        EXPECT_TRUE(isQueueName(name)) << name;
    for (const auto* name : {"", "a b", "a/b", "#", "a\n", "\xFF", "\x7f"})
        EXPECT_FALSE(isQueueName(name)) << name;
    EXPECT_FALSE(isQueueName(std::string(128, 'a')));
}

}  // namespace
}  // namespace ventras
