#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace ventras {

/// A file in libcups' temporary folder, opened exclusively, that is deleted with its owner.
/// Values move; one thread at a time.
class TemporaryFile {
public:
    /// Makes a new empty file, mode 0600.
    /// @return absent when the folder cannot be written.
    static std::optional<TemporaryFile> create();

    /// Takes over a file that someone else made, to delete it in the end; it has no descriptor.
    static TemporaryFile adopt(std::string path);

    TemporaryFile(TemporaryFile&& other) noexcept;
    TemporaryFile& operator=(TemporaryFile&& other) noexcept;
    ~TemporaryFile();

    const std::string& path() const { return path_; }

    /// The descriptor that the file was made with, for reading and writing; -1 once closed.
    int descriptor() const { return descriptor_; }

    /// Closes the descriptor and keeps the file.
    void close();

    /// Hands the descriptor to the caller, who closes it.
    int releaseDescriptor();

    /// Hands the file to the caller, who deletes it; the descriptor is closed.
    /// @return its path.
    std::string release();

private:
    TemporaryFile(std::string path, int descriptor) : path_(std::move(path)), descriptor_(descriptor) {}

    std::string path_;
    int descriptor_ = -1;
};

}  // namespace ventras
