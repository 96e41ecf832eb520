#include "platform/linux/ppd/DriverRules.h"

#include <algorithm>
#include <array>

#include "platform/Utf8.h"
#include "platform/linux/ppd/PpdFile.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

// The converters that come with the print system and that driverless PPDs name.
constexpr std::array kStockFilters{"-"sv,           "gstopdf"sv,    "gstopxl"sv,      "gstoraster"sv,
                                   "pdftopdf"sv,    "pdftops"sv,    "rastertopclm"sv, "rastertopclx"sv,
                                   "rastertopdf"sv, "rastertops"sv, "rastertopwg"sv};

// Where packages install filters that a PPD names by path.
constexpr std::array kFilterRoots{"/usr/"sv, "/opt/"sv};

bool isFileName(std::string_view name) {
    const auto isPlain = [](char c) {
        return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
               "-_.+"sv.find(c) != std::string_view::npos;
    };
    return !name.empty() && !name.starts_with('.') && std::ranges::all_of(name, isPlain);
}

bool isFilterPath(std::string_view path) {
    if (std::ranges::none_of(kFilterRoots, [&](auto root) { return path.starts_with(root); }))
        return false;
    path.remove_prefix(1);
    for (auto end = path.find('/'); end != std::string_view::npos; end = path.find('/')) {
        if (!isFileName(path.substr(0, end)))
            return false;
        path.remove_prefix(end + 1);
    }
    return isFileName(path);
}

bool isPermitted(std::string_view program, DriverKind kind) {
    switch (kind) {
        case DriverKind::Driverless:
            return std::ranges::find(kStockFilters, program) != kStockFilters.end();
        case DriverKind::Catalogue:
            return isFileName(program) || isFilterPath(program);
        case DriverKind::ScannerOnly:
            break;
    }
    return false;
}

std::string objectionTo(const std::string& line, std::string_view why) {
    return "the PPD's filter line \"" + line + "\" " + std::string(why);
}

}  // namespace

std::optional<std::string> objectionToDriver(const PpdFile& ppd, DriverKind kind) {
    if (!ppd.defect().empty())
        return ppd.defect();
    const auto effective = ppd.isScannerOnly() ? DriverKind::ScannerOnly : kind;
    const auto bad = std::ranges::find_if(ppd.filters(), [effective](const PpdFilter& filter) {
        return hasControlCharacters(filter.line) || !isPermitted(filter.program, effective);
    });
    if (bad != ppd.filters().end())
        return objectionTo(bad->line, "is none of its driver's");
    if (effective != DriverKind::Catalogue && ppd.codeLines().size() != ppd.filters().size())
        return "the PPD has filter lines within its texts, or commands for a filter";
    if (kind == DriverKind::ScannerOnly && !ppd.isScannerOnly())
        return "the PPD of a scanner does not say that it is one";
    return std::nullopt;
}

std::optional<std::string> objectionToReplacement(const PpdFile& present, const PpdFile& replacement) {
    if (!replacement.defect().empty())
        return replacement.defect();
    for (const auto& filter : replacement.filters())
        if (std::ranges::find(present.filters(), filter.line, &PpdFilter::line) == present.filters().end())
            return objectionTo(filter.line, "is not one of the queue's present driver");
    for (const auto& line : replacement.codeLines())
        if (std::ranges::find(present.codeLines(), line) == present.codeLines().end())
            return objectionTo(line, "is not one of the queue's present driver");
    return std::nullopt;
}

}  // namespace ventras
