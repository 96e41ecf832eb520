#include <cstddef>
#include <cstdint>
#include <fstream>
#include <string>
#include <string_view>

#include "devices/ScannerObject.h"
#include "devices/UsbEnumeration.h"
#include "drivers/PPDManager.h"
#include "fuzz/PPDChecks.h"
#include "fuzz/Require.h"
#include "platform/FileContent.h"
#include "platform/TemporaryFile.h"
#include "platform/linux/ppd/DriverRules.h"
#include "platform/linux/ppd/PpdFile.h"
#include "queues/ScannerPPDRewrite.h"
#include "tests/fakes/FakePlatform.h"

// A scanner's description is a line of text with a device's own name in it. It becomes a queue's PPD, or goes
// into the PPD of the printer that it is a part of. Either one names no program, or is refused.

namespace {

using namespace ventras;

constexpr const char* kPrinterPPD =
    "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*LanguageEncoding: UTF-8\n*ModelName: \"Printer\"\n"
    "*cupsFilter: \"application/pdf 0 foomatic-rip\"\n*FoomaticRIPCommandLine: \"gs\"\n";

// Everything behind the printer's own lines.
std::string withoutPrinter(const std::string& ppd) {
    require(ppd.starts_with(kPrinterPPD));
    return ppd.substr(std::string_view(kPrinterPPD).size());
}

TemporaryFile fileWith(const std::string& text) {
    auto file = TemporaryFile::create();
    require(file.has_value());
    std::ofstream(file->path(), std::ios::binary) << text;
    return std::move(*file);
}

void checkOwnQueue(const ScannerObject& scanner) {
    const auto path = scanner.ppdFile();
    require(path.has_value());
    const auto file = TemporaryFile::adopt(*path);
    const auto ppd = PpdFile::open(file.path());
    if (objectionToDriver(ppd, DriverKind::ScannerOnly))
        return;
    require(ppd.isScannerOnly());
    checkNoFilters(fileContent(file.path()).value_or(""));
}

void checkPrintersQueue(const ScannerObject& scanner) {
    FakePrintSystem printSystem;
    printSystem.queuePPDs["queue"] = kPrinterPPD;
    rewriteQueuePPDForScanner(printSystem, "queue", scanner.uuidString(), scanner.modulePath());
    for (const auto& [queue, text] : printSystem.setPPDs) {
        const auto present = fileWith(kPrinterPPD);
        const auto replacement = fileWith(text);
        if (!objectionToReplacement(PpdFile::open(present.path()), PpdFile::open(replacement.path())))
            checkNoFilters(withoutPrinter(text));
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static FakePlatform fake;
    static PPDManager drivers(fake.platform);
    static UsbEnumeration usb(fake.platform, drivers, fake.emptyUsb);
    const std::string input{reinterpret_cast<const char*>(data), size};
    const std::string_view description = input.c_str();  // an argument ends at a NUL
    const auto scanner = ScannerObject::scannerObjectWithString(description, usb, fake.computerName);
    if (!scanner)
        return 0;
    require(scanner->deviceURI() == "usb://" + scanner->uuidString());
    require(description.starts_with(scanner->uuidString()) && !scanner->isMFP());
    checkOwnQueue(*scanner);
    checkPrintersQueue(*scanner);
    return 0;
}
