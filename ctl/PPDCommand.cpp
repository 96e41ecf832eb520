#include "ctl/PPDCommand.h"

#include <cups/ppd.h>

#include <algorithm>
#include <array>

#include "ctl/Complaint.h"
#include "ctl/Json.h"
#include "ctl/LineByLine.h"
#include "ctl/Output.h"
#include "ctl/Records.h"
#include "ctl/Translation.h"
#include "drivers/PPDManager.h"

namespace ventras {
namespace {

struct EncodingName {
    TextEncoding encoding;
    const char* name;  // as registered with IANA
};

constexpr std::array kEncodingNames{
    EncodingName{TextEncoding::UTF8, "UTF-8"},
    EncodingName{TextEncoding::ISOLatin1, "ISO-8859-1"},
    EncodingName{TextEncoding::WindowsCP1252, "windows-1252"},
    EncodingName{TextEncoding::ShiftJIS, "Shift_JIS"},
};

const char* encodingOf(const std::string& path) {
    const PpdPtr ppd{ppdOpenFile(path.c_str())};
    return std::ranges::find(kEncodingNames, PPDManager::stringEncoding(ppd.get()), &EncodingName::encoding)
        ->name;
}

Value answer(const std::optional<PPDRecord>& record, bool (*ask)(const PPDRecord&)) {
    return record ? Value{ask(*record)} : Value{};
}

Object answersFor(const std::string& path, const std::optional<PPDRecord>& record) {
    return {
        {"record", record ? Value{objectOf(*record)} : Value{}},
        {"kind", PPDManager::ppdKind(record)},
        {"isPPDFile", PPDManager::isPPDFile(path)},
        {"isValidPPD", PPDManager::isValidPPD(path)},
        {"isFaxPPD", answer(record, PPDManager::isFaxPPD)},
        {"isPostscriptPPD", answer(record, PPDManager::isPostscriptPPD)},
        {"isRasterPPD", answer(record, PPDManager::isRasterPPD)},
        {"stringEncoding", encodingOf(path)},
    };
}

/// The kind of one element; null stands for no driver at all.
std::optional<unsigned> kindOf(const Value& element) {
    if (element.isNull())
        return PPDManager::ppdKind(std::optional<PPDRecord>{});
    const auto* object = std::get_if<Object>(&element);
    return object == nullptr ? std::nullopt : std::optional{PPDManager::ppdKind(recordFrom(*object))};
}

}  // namespace

Exit showPPDs(const Arguments& arguments, Output& output) {
    if (arguments.operands.empty())
        return usageError(translated("ppd: which file?"));
    auto exit = Exit::Success;
    for (const auto& path : arguments.operands) {
        const auto record = PPDManager::parsePPD(path);
        output.print(answersFor(path, record));
        if (record)
            continue;
        complain(translated("%@: no PPD that can be opened", path));
        exit = Exit::NotFound;
    }
    return exit;
}

Exit showKinds(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty() && !arguments.areFromStandardInput())
        return usageError(translated("kind: the records come on standard input"));
    const auto input = parseJson(readStandardInput());
    const auto* array = input ? std::get_if<Array>(&*input) : nullptr;
    if (array == nullptr)
        return usageError(translated("kind: standard input is no JSON array"));
    Array kinds, rows;
    for (const auto& element : *array) {
        const auto kind = kindOf(element);
        if (!kind)
            return usageError(translated("kind: element %@ is no record", std::to_string(kinds.size() + 1)));
        kinds.emplace_back(*kind);
        rows.push_back(Object{{"kind", *kind}, {"meaning", describeKind(*kind)}});
    }
    if (output.isForProgram())
        output.printJson(kinds);
    else
        output.print(rows, std::array{Column{"kind", translatable("KIND")},
                                      Column{"meaning", translatable("MEANING")}});
    return Exit::Success;
}

}  // namespace ventras
