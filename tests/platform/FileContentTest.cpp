#include "platform/FileContent.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <filesystem>
#include <string>
#include <thread>

#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

TEST(FileContent, IsEverythingInTheFile) {
    const TemporaryFolder folder;
    for (const auto& content : {std::string(), std::string("one line\n"), std::string("nul\0 \xFF", 6),
                                std::string(65536, 'x'), std::string(200'001, 'y')})
        EXPECT_EQ(fileContent(folder.write("file", content)), content) << content.size();
}

TEST(FileContent, IsThereForFilesWithoutALength) {
    EXPECT_EQ(fileContent("/proc/self/comm"),
              fileContent("/proc/self/task/" + std::to_string(gettid()) + "/comm"));
    EXPECT_FALSE(fileContent("/proc/self/comm").value_or("").empty());
}

TEST(FileContent, IsAbsentWhereNothingCanBeRead) {
    const TemporaryFolder folder;
    EXPECT_EQ(fileContent(folder / "missing"), std::nullopt);
    EXPECT_EQ(fileContent(folder.path()), std::nullopt) << "a folder opens like a file";
    EXPECT_EQ(fileContent(""), std::nullopt);
    EXPECT_EQ(fileContent("/proc/self/mem"), std::nullopt) << "its first bytes cannot be read";
}

// A pipe takes a little at a time.
TEST(WriteAll, WritesOnUntilNothingIsLeft) {
    std::array<int, 2> ends{};
    ASSERT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
    const std::string text(1'000'000, 'z');
    std::string received;
    {
        const std::jthread reader([&] {
            std::array<char, 4096> block;
            for (ssize_t length = 0; (length = read(ends[0], block.data(), block.size())) > 0;)
                received.append(block.data(), static_cast<std::size_t>(length));
        });
        EXPECT_TRUE(writeAll(ends[1], text));
        close(ends[1]);
    }
    close(ends[0]);
    EXPECT_EQ(received, text);
}

TEST(WriteAll, FailsWhereTheDiskIsFull) {
    const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
    ASSERT_GE(full, 0);
    EXPECT_FALSE(writeAll(full, "text"));
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_TRUE(writeAll(full, "")) << "nothing to write is written";
    close(full);
    EXPECT_FALSE(writeAll(-1, "text"));
    EXPECT_EQ(errno, EBADF);
}

}  // namespace
}  // namespace ventras
