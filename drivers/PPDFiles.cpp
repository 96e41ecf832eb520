#include "drivers/PPDFiles.h"

#include <gio/gio.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string_view>
#include <system_error>

#include "drivers/PPDRecord.h"
#include "platform/Handles.h"
#include "platform/IppConnection.h"
#include "platform/PrintSystemService.h"
#include "platform/TemporaryFile.h"

namespace ventras::PPDFiles {
namespace {

// Names that the scheduler reports relative to the root folder.
constexpr std::array<std::string_view, 2> kInstalledFolders{"Library/Printers",
                                                            "System/Library/Printers/PPDs"};

/// The length that a gzip file says it has when unfolded (RFC 1952, its last four bytes).
std::optional<std::uint32_t> unfoldedLength(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::array<unsigned char, 4> bytes{};
    file.seekg(-4, std::ios::end);
    if (!file.read(reinterpret_cast<char*>(bytes.data()), bytes.size()))
        return std::nullopt;
    std::uint32_t length = 0;
    for (int i = 3; i >= 0; --i)
        length = length << 8 | bytes.at(static_cast<std::size_t>(i));
    return length;
}

/// Copies one open file into another. @return how many bytes, absent when either fails on the way.
std::optional<std::size_t> copyBlocks(cups_file_t* source, cups_file_t* copy) {
    std::array<char, 4096> block{};
    std::size_t copied = 0;
    errno = 0;  // libcups says "end of file" of a damaged gzip file too; only the error number differs
    for (;;) {
        const auto bytes = cupsFileRead(source, block.data(), block.size());
        if (bytes <= 0)
            break;
        copied += static_cast<std::size_t>(bytes);
        // A small gzip file may well unfold to more than the disk holds.
        if (copied > kLargestPPD ||
            cupsFileWrite(copy, block.data(), static_cast<std::size_t>(bytes)) < bytes)
            return std::nullopt;
    }
    if (errno != 0 || cupsFileEOF(source) == 0 || cupsFileFlush(copy) != 0)
        return std::nullopt;
    return copied;
}

bool copyFile(const std::string& path, TemporaryFile& destination) {
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error))
        return false;
    const CupsFilePtr source{cupsFileOpen(path.c_str(), "r")};
    const CupsFilePtr copy{cupsFileOpenFd(destination.descriptor(), "w")};
    if (copy)
        destination.releaseDescriptor();
    if (!source || !copy)
        return false;

    const auto copied = copyBlocks(source.get(), copy.get());
    // libcups only still knows of the compression when the compressed data had no end, or in some versions
    // always.
    const bool compressed = cupsFileCompression(source.get()) == CUPS_FILE_GZIP;
    return copied && (!compressed || unfoldedLength(path) == *copied);
}

/// The path in a "file" URL (RFC 8089), percent-escapes resolved; absent when it is no URL.
std::optional<std::string> pathOf(const std::string& url) {
    const std::unique_ptr<GUri, decltype(&g_uri_unref)> parsed{
        g_uri_parse(url.c_str(), G_URI_FLAGS_NONE, nullptr), g_uri_unref};
    if (!parsed)
        return std::nullopt;
    return g_uri_get_path(parsed.get());
}

std::string localizedName(const std::string& name, PrintSystemService& printSystem) {
    if (std::ranges::none_of(kInstalledFolders, [&](auto folder) { return name.starts_with(folder); }))
        return name;
    return printSystem.copyLocalizedPPD("/" + name).value_or(name);
}

std::optional<std::string> fetchFromScheduler(const std::string& name) {
    auto file = TemporaryFile::create();
    if (!file)
        return std::nullopt;

    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PPD)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "ppd-name", nullptr, name.c_str());
    const auto answer =
        IppConnection::toScheduler().exchange(std::move(request), "/", -1, file->descriptor());
    return answer.succeeded() ? std::optional(file->release()) : std::nullopt;
}

}  // namespace

std::optional<std::string> copyOf(const std::optional<std::string>& path) {
    if (!path)
        return std::nullopt;
    auto copy = TemporaryFile::create();
    if (!copy || !copyFile(*path, *copy))
        return std::nullopt;
    return copy->release();
}

std::optional<std::string> fetch(const PPDRecord& record, PrintSystemService& printSystem) {
    if (!record.name)
        return std::nullopt;
    const auto name = localizedName(*record.name, printSystem);
    if (name.starts_with('/'))
        return copyOf(name);
    if (name.starts_with("file://"))
        return copyOf(pathOf(name));
    if (auto file = fetchFromScheduler(name))
        return file;
    return copyOf(name);
}

}  // namespace ventras::PPDFiles
