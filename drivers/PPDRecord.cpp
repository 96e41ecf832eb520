#include "drivers/PPDRecord.h"

#include <array>
#include <string_view>
#include <utility>
#include <variant>

namespace ventras {
namespace {

using Texts = std::vector<std::string>;

struct Field {
    std::string_view key;
    std::variant<std::optional<std::string> PPDRecord::*, Texts PPDRecord::*,
                 std::optional<Texts> PPDRecord::*, std::optional<std::int64_t> PPDRecord::*,
                 std::optional<bool> PPDRecord::*, std::optional<PropertyValue> PPDRecord::*>
        member;
};

constexpr std::array kFields{
    Field{"ppd_name", &PPDRecord::name},
    Field{"ppd_make", &PPDRecord::make},
    Field{"ppd_make_and_model", &PPDRecord::makeAndModel},
    Field{"ppd_product", &PPDRecord::product},
    Field{"ppd_device_id", &PPDRecord::deviceID},
    Field{"ppd_model_number", &PPDRecord::modelNumber},
    Field{"ppd_type", &PPDRecord::type},
    Field{"ppd_filters", &PPDRecord::filters},
    Field{"ppd_natural_language", &PPDRecord::naturalLanguage},
    Field{"ppd_language_level", &PPDRecord::languageLevel},
    Field{"ppd_color", &PPDRecord::color},
    Field{"ppd_throughput", &PPDRecord::throughput},
    Field{"ppd_file_version", &PPDRecord::fileVersion},
    Field{"ppd_language_version", &PPDRecord::languageVersion},
    Field{"ppd_iconpath", &PPDRecord::iconPath},
    Field{"ppd_inktool", &PPDRecord::inkTool},
    Field{"ppd_cups_commands", &PPDRecord::cupsCommands},
    Field{"ppd_psversion", &PPDRecord::psVersion},
    Field{"ppd_pdes", &PPDRecord::pdes},
    Field{"ppd_secure_vellum", &PPDRecord::secureVellum},
    Field{"KioskoSUDriverPredicateStr", &PPDRecord::suDriverPredicate},
    Field{"kKioskoSUDriverConflicts", &PPDRecord::suDriverConflicts},
    Field{"KioskoSUCacheCurrent", &PPDRecord::suCacheCurrent},
    Field{"KioskoDriverName", &PPDRecord::driverName},
};

std::optional<PropertyValue> valueOf(const Texts& texts) {
    if (texts.empty())
        return std::nullopt;
    return PropertyArray(texts.begin(), texts.end());
}

std::optional<PropertyValue> valueOf(const std::optional<Texts>& texts) {
    if (!texts)
        return std::nullopt;
    return PropertyArray(texts->begin(), texts->end());
}

template <typename Value>
std::optional<PropertyValue> valueOf(const std::optional<Value>& value) {
    return value;
}

void set(std::optional<PropertyValue>& field, const PropertyValue& value) {
    field = value;
}

template <typename Value>
void set(std::optional<Value>& field, const PropertyValue& value) {
    if (const auto* held = std::get_if<Value>(&value))
        field = *held;
}

void set(Texts& field, const PropertyValue& value) {
    const auto* array = std::get_if<PropertyArray>(&value);
    if (array == nullptr)
        return;
    for (const auto& element : *array)
        if (const auto* text = std::get_if<std::string>(&element))
            field.push_back(*text);
}

void set(std::optional<Texts>& field, const PropertyValue& value) {
    if (std::holds_alternative<PropertyArray>(value))
        set(field.emplace(), value);
}

}  // namespace

PropertyDictionary dictionaryFromRecord(const PPDRecord& record) {
    PropertyDictionary dictionary;
    for (const auto& [key, member] : kFields) {
        auto value = std::visit([&](auto field) { return valueOf(record.*field); }, member);
        if (value)
            dictionary.emplace(key, *std::move(value));
    }
    return dictionary;
}

PPDRecord recordFromDictionary(const PropertyDictionary& dictionary) {
    PPDRecord record;
    for (const auto& [key, member] : kFields) {
        const auto entry = dictionary.find(key);
        if (entry != dictionary.end())
            std::visit([&](auto field) { set(record.*field, entry->second); }, member);
    }
    return record;
}

}  // namespace ventras
