#pragma once

#include <string>
#include <string_view>

namespace ventras {

/// A file that can be opened by name and never reaches a disk. One thread at a time.
class FileInMemory {
public:
    FileInMemory();
    FileInMemory(const FileInMemory&) = delete;
    FileInMemory& operator=(const FileInMemory&) = delete;
    ~FileInMemory();

    /// Replaces its content.
    void hold(std::string_view content) const;

    /// For whoever follows symbolic links.
    std::string path() const { return "/proc/self/fd/" + std::to_string(descriptor_); }

private:
    int descriptor_;
};

}  // namespace ventras
