#include "drivers/PPDValues.h"

namespace ventras {

PPDValues::PPDValues(ppd_file_t* ppd)
    : ppd_(ppd), encoding_(textEncodingNamed(bytes("LanguageEncoding").value_or(""))) {}

std::optional<std::string> PPDValues::text(const char* keyword) const {
    const auto value = bytes(keyword);
    return value ? decoded(*value, encoding_) : std::nullopt;
}

std::optional<std::string> PPDValues::utf8(const char* keyword) const {
    const auto value = bytes(keyword);
    return value ? decoded(*value, TextEncoding::UTF8) : std::nullopt;
}

std::optional<std::string> PPDValues::bytes(const char* keyword) const {
    const auto* attribute = ppdFindAttr(ppd_, keyword, nullptr);
    if (attribute == nullptr || attribute->value == nullptr)
        return std::nullopt;
    return attribute->value;
}

std::vector<std::string> PPDValues::allBytes(const char* keyword) const {
    std::vector<std::string> values;
    for (const auto* attribute = ppdFindAttr(ppd_, keyword, nullptr); attribute != nullptr;
         attribute = ppdFindNextAttr(ppd_, keyword, nullptr)) {
        if (attribute->value != nullptr)
            values.emplace_back(attribute->value);
    }
    return values;
}

}  // namespace ventras
