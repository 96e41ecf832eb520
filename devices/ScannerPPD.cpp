#include "devices/ScannerPPD.h"

#include <string_view>

#include "platform/Handles.h"
#include "platform/TemporaryFile.h"

namespace ventras {
namespace {

constexpr std::string_view kHead =
    "*PPD-Adobe: \"4.3\"\n"
    "*FormatVersion: \"4.3\"\n"
    "*LanguageEncoding: ISOLatin1\n"
    "*LanguageVersion: English\n"
    "*FileVersion: \"1.0\"\n"
    "*PCFileName: \"Scanner.ppd\"\n"
    "*Manufacturer: \"Scanner Printer Manufacturer\"\n"
    "*Product: \"(Scanner)\"\n";

std::string line(std::string_view keyword, std::string_view value) {
    return "*" + std::string(keyword) + ": \"" + std::string(value) + "\"\n";
}

std::string textOf(const ScannerPPD& scanner) {
    std::string text(kHead);
    text += line("ModelName", scanner.model);
    text += line("ShortNickName", scanner.model);
    text += line("NickName", scanner.model);
    text += "*QLScannerOnly: True\n";
    text += line("QLScannerUUID", scanner.uuid);
    text += line("QLPersistentIDString", scanner.persistentID);
    if (scanner.modulePath)
        text += line("QLScannerModulePath", *scanner.modulePath);
    text += "*QLICADriver: True\n";
    if (scanner.iconPath)
        text += line("QLPrinterIconPath", *scanner.iconPath);
    text += line("cupsLanguages", "en");
    if (scanner.isShared)
        text += "*QLRemoteQueueID: shared\n";
    return text;
}

}  // namespace

std::optional<std::string> writeScannerPPD(const ScannerPPD& scanner) {
    auto file = TemporaryFile::create();
    if (!file)
        return std::nullopt;
    const CupsFilePtr output{cupsFileOpenFd(file->descriptor(), "w")};
    if (!output)
        return std::nullopt;
    file->releaseDescriptor();  // libcups closes it with its file
    const auto text = textOf(scanner);
    const auto written = cupsFileWrite(output.get(), text.data(), text.size());
    const bool isComplete = written == static_cast<ssize_t>(text.size()) && cupsFileFlush(output.get()) == 0;
    return isComplete ? std::optional{file->release()} : std::nullopt;
}

}  // namespace ventras
