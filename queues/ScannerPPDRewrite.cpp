#include "queues/ScannerPPDRewrite.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "platform/Handles.h"
#include "platform/PrintSystemService.h"
#include "platform/TemporaryFile.h"

namespace ventras {
namespace {

using namespace std::literals;

constexpr std::array kScannerKeywords{"*QLScannerModulePath"sv, "*QLScannerUUID"sv, "*QLICADriver"sv};
// Bytes that are compared at once; longer lines are copied in pieces.
constexpr std::size_t kLongestLine = 1025;

bool namesScanner(const std::string& ppdPath, const std::string& uuid) {
    const PpdPtr ppd{ppdOpenFile(ppdPath.c_str())};
    const auto* attribute = ppd ? ppdFindAttr(ppd.get(), "QLScannerUUID", nullptr) : nullptr;
    return attribute != nullptr && attribute->value != nullptr && uuid == attribute->value;
}

bool isCopied(std::string_view line) {
    return std::ranges::none_of(kScannerKeywords,
                                [&](std::string_view keyword) { return line.starts_with(keyword); });
}

bool write(cups_file_t* output, std::string_view bytes) {
    return cupsFileWrite(output, bytes.data(), bytes.size()) >= 0;
}

// A last line that has no end gets one, so that what follows stands on a line of its own.
bool copyOtherLines(const std::string& ppdPath, cups_file_t* output) {
    const CupsFilePtr input{cupsFileOpen(ppdPath.c_str(), "r")};
    if (!input)
        return true;
    std::array<char, kLongestLine + 1> buffer{};
    bool isLineComplete = true;
    while (const auto length = cupsFileGetLine(input.get(), buffer.data(), buffer.size())) {
        const std::string_view line{buffer.data(), length};
        if (!isCopied(line))
            continue;
        if (!write(output, line))
            return false;
        isLineComplete = line.ends_with('\n') || line.ends_with('\r');
    }
    return isLineComplete || write(output, "\n");
}

bool appendScanner(cups_file_t* output, const std::string& uuid,
                   const std::optional<std::string>& modulePath) {
    std::string lines = "*QLScannerUUID: \"" + uuid + "\"\n";
    if (modulePath)
        lines += "*QLScannerModulePath: \"" + *modulePath + "\"\n";
    return write(output, lines + "*QLICADriver: \"True\"\n\n");
}

}  // namespace

std::int32_t rewriteQueuePPDForScanner(PrintSystemService& printSystem,
                                       const std::optional<std::string>& queueName,
                                       const std::optional<std::string>& uuid,
                                       const std::optional<std::string>& modulePath) {
    if (!queueName || !uuid)
        return -1;
    const auto current = TemporaryFile::adopt(printSystem.copyQueuePPD(*queueName).value_or(""));
    if (namesScanner(current.path(), *uuid))
        return 0;

    auto rewritten = TemporaryFile::create();
    if (!rewritten)
        return 0;
    CupsFilePtr output{cupsFileOpenFd(rewritten->releaseDescriptor(), "w")};
    if (!output)
        return 0;
    const bool isWritten =
        copyOtherLines(current.path(), output.get()) && appendScanner(output.get(), *uuid, modulePath);
    const bool isStored = cupsFileClose(output.release()) == 0;
    if (isWritten && isStored)  // half a PPD, of a full disk, would spoil a queue that works
        printSystem.setQueuePPD(*queueName, rewritten->path());
    return 0;
}

}  // namespace ventras
