#include "queues/QueueStatus.h"

#include <gtest/gtest.h>

#include <string_view>

namespace ventras {
namespace {

struct StatusCase {
    std::int32_t status;
    std::string_view text;
};
constexpr StatusCase kFailures[] = {
    {241, "no driver for it was found"},
    {255, "it is of no kind that can be set up"},
    {-1, "there is no device"},
    {-30886, "its description cannot be stored, or the print server has no address"},
    {-620, "no queue name can be made of its name"},
    {65, "its settings are not safe to use"},
    {69, "the print scheduler, or the printer itself, does not answer"},
    {73, "the print scheduler refuses the queue"},
    {77, "the print scheduler does not let this user make queues"},
    {4711, "the print system reports this status"},
};

TEST(QueueStatus, TellsInWordsWhyADeviceHasNoQueue) {
    for (const auto& [status, text] : kFailures) {
        EXPECT_EQ(QueueStatus::describe(status), text) << status;
        EXPECT_FALSE(QueueStatus::isServed(status)) << status;
    }
}

TEST(QueueStatus, CountsADeviceAsServedByANewQueueAndByAnOldOne) {
    EXPECT_TRUE(QueueStatus::isServed(0));
    EXPECT_TRUE(QueueStatus::isServed(242));
}

}  // namespace
}  // namespace ventras
