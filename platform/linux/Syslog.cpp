#include "platform/linux/Syslog.h"

#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "platform/Utf8.h"
#include "platform/linux/Utf8Character.h"

namespace ventras {
namespace {

constexpr const char* kIdentity = "ventrasagent";

// JOURNAL_STREAM is "device:inode" of the stream that the service manager gave; a child may have replaced it.
bool isJournalStream(int descriptor) {
    const char* stream = std::getenv("JOURNAL_STREAM");
    struct stat status {};
    if (stream == nullptr || fstat(descriptor, &status) != 0)
        return false;
    const auto expected = std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
    return expected == stream;
}

void appendEscaped(std::string& line, char byte) {
    constexpr std::string_view kDigits = "0123456789ABCDEF";
    const auto value = static_cast<std::uint8_t>(byte);
    line += {'\\', 'x', kDigits[value >> 4U], kDigits[value & 0xFU]};
}

}  // namespace

Syslog::Syslog() : alsoOnStandardError_(isatty(STDERR_FILENO) == 1 || isJournalStream(STDERR_FILENO)) {
    openlog(kIdentity, LOG_PID, LOG_DAEMON);
}

void Syslog::error(const std::string& line) {
    const auto harmless = harmlessLine(line);
    syslog(LOG_ERR, "%s", harmless.c_str());
    if (alsoOnStandardError_)
        std::fprintf(stderr, "%s: %s\n", kIdentity, harmless.c_str());
}

std::string harmlessLine(std::string_view text) {
    std::string line;
    line.reserve(text.size());
    while (!text.empty()) {
        const auto character = firstUtf8Character(text);
        const auto length = std::max<std::size_t>(character.size(), 1);
        if (character.empty() || hasControlCharacters(character))
            for (const char byte : text.substr(0, length))
                appendEscaped(line, byte);
        else
            line += character;
        text.remove_prefix(length);
    }
    return line;
}

}  // namespace ventras
