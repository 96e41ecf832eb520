#include "platform/TemporaryFile.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <set>
#include <thread>
#include <vector>

#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

// libcups reads TMPDIR anew for each file.
class TemporaryFiles : public testing::Test {
protected:
    TemporaryFiles() {
        if (const char* present = std::getenv("TMPDIR"); present != nullptr)
            before_ = present;
        setenv("TMPDIR", folder_.path().c_str(), 1);
    }
    ~TemporaryFiles() override {
        if (before_)
            setenv("TMPDIR", before_->c_str(), 1);
        else
            unsetenv("TMPDIR");
    }

    bool isEmpty() const { return fs::is_empty(folder_.path()); }

    std::optional<std::string> before_;
    TemporaryFolder folder_;
};

bool isOpen(int descriptor) {
    return fcntl(descriptor, F_GETFD) != -1;
}

TEST_F(TemporaryFiles, AreNewEmptyAndPrivate) {
    const auto file = TemporaryFile::create();
    ASSERT_TRUE(file);
    EXPECT_EQ(fs::path(file->path()).parent_path(), folder_.path());
    struct stat status {};
    ASSERT_EQ(stat(file->path().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777U, 0600U);
    EXPECT_EQ(status.st_size, 0);
}

TEST_F(TemporaryFiles, AreGoneWithTheirOwner) {
    int descriptor = -1;
    {
        const auto file = TemporaryFile::create();
        descriptor = file->descriptor();
        EXPECT_TRUE(isOpen(descriptor));
        EXPECT_FALSE(isEmpty());
    }
    EXPECT_FALSE(isOpen(descriptor));
    EXPECT_TRUE(isEmpty());
}

TEST_F(TemporaryFiles, CanBeWrittenAndReadThroughTheirDescriptor) {
    const auto file = TemporaryFile::create();
    ASSERT_EQ(write(file->descriptor(), "text", 4), 4);
    EXPECT_EQ(readFile(file->path()), "text");
}

TEST_F(TemporaryFiles, AreAbsentWhereNothingCanBeWritten) {
    setenv("TMPDIR", (folder_ / "missing").c_str(), 1);
    EXPECT_FALSE(TemporaryFile::create());
}

TEST_F(TemporaryFiles, StayWhenOnlyTheDescriptorIsClosed) {
    auto file = TemporaryFile::create();
    const int descriptor = file->descriptor();
    file->close();
    EXPECT_FALSE(isOpen(descriptor));
    EXPECT_EQ(file->descriptor(), -1);
    EXPECT_TRUE(fs::exists(file->path()));
    file->close();
    EXPECT_EQ(file->descriptor(), -1);
}

TEST_F(TemporaryFiles, HandOverTheirDescriptor) {
    int descriptor = -1;
    {
        auto file = TemporaryFile::create();
        descriptor = file->releaseDescriptor();
        EXPECT_EQ(file->descriptor(), -1);
    }
    EXPECT_TRUE(isOpen(descriptor));
    EXPECT_TRUE(isEmpty());
    ::close(descriptor);
}

TEST_F(TemporaryFiles, HandOverTheFile) {
    std::string path;
    int descriptor = -1;
    {
        auto file = TemporaryFile::create();
        descriptor = file->descriptor();
        path = file->release();
        EXPECT_EQ(file->path(), "");
    }
    EXPECT_FALSE(isOpen(descriptor));
    EXPECT_TRUE(fs::exists(path));
}

TEST_F(TemporaryFiles, TakeOverAFile) {
    const auto path = folder_.write("made by someone else", "text");
    {
        const auto file = TemporaryFile::adopt(path);
        EXPECT_EQ(file.path(), path);
        EXPECT_EQ(file.descriptor(), -1);
        EXPECT_TRUE(fs::exists(path));
    }
    EXPECT_FALSE(fs::exists(path));
}

TEST_F(TemporaryFiles, MoveAndAreDeletedOnce) {
    auto first = TemporaryFile::create();
    const auto firstPath = first->path();
    {
        const TemporaryFile second = std::move(*first);
        EXPECT_EQ(second.path(), firstPath);
        EXPECT_TRUE(fs::exists(firstPath));
    }
    EXPECT_FALSE(fs::exists(firstPath));
    folder_.write(fs::path(firstPath).filename().string(), "somebody's new file");
    first.reset();
    EXPECT_TRUE(fs::exists(firstPath)) << "a file that was moved from deletes nothing";
}

TEST_F(TemporaryFiles, AreDeletedWhenTheyAreReplaced) {
    auto first = TemporaryFile::create();
    {
        auto second = TemporaryFile::create();
        const auto secondPath = second->path();
        *first = std::move(*second);
        EXPECT_EQ(first->path(), secondPath);
    }
    EXPECT_TRUE(fs::exists(first->path()));
    first.reset();
    EXPECT_TRUE(isEmpty());
}

TEST_F(TemporaryFiles, HaveDifferentNamesOnAllThreads) {
    constexpr int kThreads = 8;
    constexpr int kEach = 50;
    std::vector<std::vector<TemporaryFile>> files(kThreads);
    {
        std::vector<std::jthread> threads;
        for (auto& own : files)
            threads.emplace_back([&own] {
                for (int i = 0; i < kEach; ++i)
                    if (auto file = TemporaryFile::create())
                        own.push_back(std::move(*file));
            });
    }
    std::set<std::string> names;
    for (const auto& own : files)
        for (const auto& file : own)
            names.insert(file.path());
    EXPECT_EQ(names.size(), kThreads * kEach);
}

}  // namespace
}  // namespace ventras
