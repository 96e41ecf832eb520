#include "platform/TemporaryFile.h"

#include <cups/cups.h>
#include <unistd.h>

#include <array>
#include <utility>

namespace ventras {

std::optional<TemporaryFile> TemporaryFile::create() {
    std::array<char, 1024> name{};
    const int descriptor = cupsTempFd(name.data(), static_cast<int>(name.size()));
    if (descriptor < 0)
        return std::nullopt;
    return TemporaryFile{name.data(), descriptor};
}

TemporaryFile TemporaryFile::adopt(std::string path) {
    return TemporaryFile{std::move(path), -1};
}

TemporaryFile::TemporaryFile(TemporaryFile&& other) noexcept
    : path_(std::exchange(other.path_, {})), descriptor_(std::exchange(other.descriptor_, -1)) {}

TemporaryFile& TemporaryFile::operator=(TemporaryFile&& other) noexcept {
    std::swap(path_, other.path_);
    std::swap(descriptor_, other.descriptor_);
    return *this;
}

TemporaryFile::~TemporaryFile() {
    close();
    if (!path_.empty())
        unlink(path_.c_str());
}

void TemporaryFile::close() {
    if (descriptor_ >= 0)
        ::close(std::exchange(descriptor_, -1));
}

int TemporaryFile::releaseDescriptor() {
    return std::exchange(descriptor_, -1);
}

std::string TemporaryFile::release() {
    close();
    return std::exchange(path_, {});
}

}  // namespace ventras
