#pragma once

#include <sys/types.h>

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace ventras {

/// A new folder that is removed with its content. Its path is short, because a UNIX socket's path ends at
/// 107 bytes. One thread at a time.
class TemporaryFolder {
public:
    /// @param owner who it belongs to; absent: the user of the test
    explicit TemporaryFolder(std::optional<uid_t> owner = {});
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;
    ~TemporaryFolder();

    const std::filesystem::path& path() const { return path_; }
    std::filesystem::path operator/(std::string_view name) const { return path_ / name; }

    /// Writes a file, together with the folders on the way to it.
    /// @return its path.
    std::filesystem::path write(std::string_view name, std::string_view content) const;

private:
    std::filesystem::path path_;
};

/// The content of a file; empty when it cannot be read.
std::string readFile(const std::filesystem::path& path);

/// One of the documents that come with the tests: "hello.pdf" (3 pages) or "hello.txt".
std::filesystem::path testDocument(std::string_view name);

}  // namespace ventras
