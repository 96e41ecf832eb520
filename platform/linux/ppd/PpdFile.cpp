#include "platform/linux/ppd/PpdFile.h"

#include <fcntl.h>
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <optional>
#include <system_error>

#include "platform/PrintSystemService.h"

namespace ventras {
namespace {

constexpr std::string_view kBlanks = " \t";

std::string_view nextWord(std::string_view& text) {
    text.remove_prefix(std::min(text.find_first_not_of(kBlanks), text.size()));
    const auto word = text.substr(0, text.find_first_of(kBlanks));
    text.remove_prefix(word.size());
    return word;
}

bool isNumber(std::string_view text) {
    return !text.empty() && text.find_first_not_of("0123456789") == std::string_view::npos;
}

bool isMimeType(std::string_view text) {
    const auto slash = text.find('/');
    return slash != std::string_view::npos && slash > 0 && slash + 1 < text.size();
}

// "source cost program" or "source destination cost program", the program perhaps behind a "maxsize(bytes)".
std::string programIn(std::string_view value, int typeCount) {
    for (int i = 0; i < typeCount; ++i)
        if (!isMimeType(nextWord(value)))
            return {};
    if (!isNumber(nextWord(value)))
        return {};
    auto program = nextWord(value);
    if (program.starts_with("maxsize(") && program.ends_with(")"))
        program = nextWord(value);
    return nextWord(value).empty() ? std::string(program) : std::string();
}

struct FilterKeyword {
    const char* name;
    int typeCount;
};
constexpr FilterKeyword kFilterKeywords[] = {{"cupsFilter", 1}, {"cupsFilter2", 2}, {"cupsPreFilter", 1}};

constexpr std::string_view kCodeKeywords[] = {"*cupsFilter", "*cupsPreFilter", "*FoomaticRIP"};

bool isCode(std::string_view line) {
    return std::ranges::any_of(kCodeKeywords, [line](std::string_view keyword) {
        return line.size() >= keyword.size() && strncasecmp(line.data(), keyword.data(), keyword.size()) == 0;
    });
}

// libcups closes the descriptor that it is given.
int duplicated(int descriptor) {
    return fcntl(descriptor, F_DUPFD_CLOEXEC, 0);
}

PpdPtr openDuplicate(int descriptor) {
    const int duplicate = duplicated(descriptor);
    return PpdPtr{duplicate < 0 ? nullptr : ppdOpenFd(duplicate)};
}

}  // namespace

PpdFile PpdFile::open(const std::string& path) {
    PpdFile ppd;
    // Without O_NONBLOCK a named pipe would hold us here for ever.
    ppd.file_ = FileDescriptor{::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOFOLLOW | O_CLOEXEC)};
    struct stat status {};
    if (ppd.file_.get() < 0 || fstat(ppd.file_.get(), &status) != 0)
        ppd.defect_ = "the PPD cannot be read: " + std::generic_category().message(errno);
    else if (!S_ISREG(status.st_mode))
        ppd.defect_ = "the PPD is no regular file";
    else if (status.st_size == 0)
        ppd.defect_ = "the PPD is empty";
    else if (status.st_size > static_cast<off_t>(kLargestPPD))
        ppd.defect_ = "the PPD is too large";
    else
        ppd.read();
    return ppd;
}

int PpdFile::descriptor() const {
    lseek(file_.get(), 0, SEEK_SET);
    return file_.get();
}

void PpdFile::read() {
    const auto ppd = openDuplicate(descriptor());
    if (!ppd) {
        int line = 0;
        const auto status = ppdLastError(&line);
        defect_ = std::string("libcups does not read the PPD: ") + ppdErrorString(status) + " in line " +
                  std::to_string(line);
        return;
    }
    collectFilters(ppd.get());
    collectCodeLines();
    for (auto* entry = ppdFindAttr(ppd.get(), "QLScannerOnly", nullptr); entry != nullptr;
         entry = ppdFindNextAttr(ppd.get(), "QLScannerOnly", nullptr))
        isScannerOnly_ = isScannerOnly_ || (entry->value != nullptr && strcasecmp(entry->value, "True") == 0);
}

void PpdFile::collectFilters(ppd_file_t* ppd) {
    // Not from the list of filters in ppd_file_t: that leaves out some when there are lines of both kinds.
    for (const auto& [name, typeCount] : kFilterKeywords)
        for (auto* entry = ppdFindAttr(ppd, name, nullptr); entry != nullptr;
             entry = ppdFindNextAttr(ppd, name, nullptr)) {
            const std::string value = entry->value == nullptr ? "" : entry->value;
            filters_.push_back({std::string(name) + " " + value, programIn(value, typeCount)});
        }
}

void PpdFile::collectCodeLines() {
    const int duplicate = duplicated(descriptor());
    const CupsFilePtr text{duplicate < 0 ? nullptr : cupsFileOpenFd(duplicate, "r")};
    std::array<char, 1024> line{};
    while (text && cupsFileGets(text.get(), line.data(), line.size()) != nullptr)
        if (isCode(line.data()))
            codeLines_.emplace_back(line.data());
}

}  // namespace ventras
