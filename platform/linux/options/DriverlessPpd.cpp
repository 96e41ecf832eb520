#include "platform/linux/options/DriverlessPpd.h"

#include <cupsfilters/ppdgenerator.h>
#include <dlfcn.h>

#include <array>
#include <atomic>
#include <fstream>
#include <mutex>
#include <optional>
#include <string_view>
#include <utility>

#include "platform/FileContent.h"
#include "platform/linux/ppd/DriverRules.h"
#include "platform/linux/ppd/PpdFile.h"

namespace ventras {
namespace {

using Generate = decltype(&ppdCreateFromIPP);

// With all that it depends on, this library takes longer to load than the rest of the program together; runs
// for printers that do not speak IPP, or that have a queue already, do without it.
Generate loadGenerator() {
    void* library = dlopen("libcupsfilters.so.1", RTLD_LAZY | RTLD_LOCAL);
    return library == nullptr ? nullptr : reinterpret_cast<Generate>(dlsym(library, "ppdCreateFromIPP"));
}

Generate loadedGenerator() {
    static const Generate generator = loadGenerator();
    return generator;
}

std::optional<TemporaryFile> generate(ipp_t* capabilities) {
    static std::mutex oneAtATime;  // the generator keeps its last message in a global variable
    const std::lock_guard lock(oneAtATime);
    const Generate generator = loadedGenerator();
    std::array<char, 1024> path{};
    if (generator == nullptr ||
        generator(path.data(), path.size(), capabilities, nullptr, nullptr, 0, 0) == nullptr ||
        path.front() == '\0')
        return std::nullopt;
    return TemporaryFile::adopt(path.data());
}

// The generator writes UTF-8 and calls it Latin-1, which garbles every size with inches in its name.
constexpr std::string_view kWrongEncoding = "*LanguageEncoding: ISOLatin1\n";
constexpr std::string_view kEncoding = "*LanguageEncoding: UTF-8\n";
constexpr std::string_view kFaxMark = "*cupsFax: True\n";

std::string corrected(std::string text, PrinterService service) {
    if (const auto wrong = text.find(kWrongEncoding); wrong != std::string::npos)
        text.replace(wrong, kWrongEncoding.size(), kEncoding);
    if (service == PrinterService::FaxOut && text.find(kFaxMark) == std::string::npos)
        text += kFaxMark;
    return text;
}

bool correct(const std::string& path, PrinterService service) {
    auto text = fileContent(path);
    if (!text)
        return false;
    std::ofstream output(path, std::ios::binary);
    output << corrected(*std::move(text), service);
    return output.flush().good();
}

}  // namespace

std::jthread loadPPDGenerator() {
    static std::atomic<bool> begun = false;
    // Nothing comes of an empty description; but the first call reads all the texts that PPDs are made with.
    return begun.exchange(true) ? std::jthread() : std::jthread([] { generate(IppPtr{ippNew()}.get()); });
}

std::variant<TemporaryFile, std::string> driverlessPPD(ipp_t* capabilities, PrinterService service) {
    auto file = generate(capabilities);
    if (!file)
        return "its description is not enough for a driver";
    if (!correct(file->path(), service))
        return "its driver cannot be written";
    if (auto objection = objectionToDriver(PpdFile::open(file->path()), DriverKind::Driverless))
        return *objection;
    return std::move(*file);
}

}  // namespace ventras
