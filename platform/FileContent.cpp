#include "platform/FileContent.h"

#include <unistd.h>

#include <array>
#include <cerrno>
#include <fstream>

namespace ventras {

// By blocks, because an iterator over the file would throw for a folder, which opens like a file.
std::optional<std::string> fileContent(const std::filesystem::path& path) {
    std::ifstream file(path, std::ios::binary);
    std::string content;
    std::array<char, 65536> block;
    while (file) {
        file.read(block.data(), block.size());
        content.append(block.data(), static_cast<std::size_t>(file.gcount()));
    }
    return file.eof() && !file.bad() ? std::optional{std::move(content)} : std::nullopt;
}

bool writeAll(int descriptor, std::string_view bytes) {
    while (!bytes.empty()) {
        const auto written = write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR)
            continue;
        if (written <= 0)
            return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

}  // namespace ventras
