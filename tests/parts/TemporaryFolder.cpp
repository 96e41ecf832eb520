#include "tests/parts/TemporaryFolder.h"

#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <fstream>
#include <system_error>

#include "platform/FileContent.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

// Leaves room for the names of the sockets and folders inside.
constexpr std::size_t kLongestParent = 60;

std::string parentFolder() {
    const char* folder = std::getenv("TMPDIR");
    const std::string path = folder != nullptr ? folder : "";
    return path.empty() || path.size() > kLongestParent ? "/tmp" : path;
}

}  // namespace

TemporaryFolder::TemporaryFolder(std::optional<uid_t> owner) {
    std::string name = parentFolder() + "/ventras-XXXXXX";
    if (mkdtemp(name.data()) == nullptr)
        throw std::system_error(errno, std::generic_category(), name);
    path_ = name;
    fs::permissions(path_, fs::perms{0755});
    if (owner && chown(name.c_str(), *owner, static_cast<gid_t>(-1)) != 0)
        throw std::system_error(errno, std::generic_category(), name);
}

TemporaryFolder::~TemporaryFolder() {
    std::error_code ignored;
    fs::remove_all(path_, ignored);
}

fs::path TemporaryFolder::write(std::string_view name, std::string_view content) const {
    const auto file = path_ / name;
    fs::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << content;
    return file;
}

std::string readFile(const fs::path& path) {
    return fileContent(path).value_or("");
}

fs::path testDocument(std::string_view name) {
    return fs::path(VENTRAS_TEST_DOCUMENTS) / name;
}

}  // namespace ventras
