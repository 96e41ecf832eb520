#include "ctl/Records.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "ctl/Json.h"

namespace ventras {
namespace {

struct ToValue {
    Value operator()(bool flag) const { return flag; }
    Value operator()(std::int64_t number) const { return number; }
    Value operator()(const std::string& text) const { return text; }
    Value operator()(const PropertyArray& array) const {
        Array values;
        for (const auto& element : array)
            values.push_back(valueOf(element));
        return values;
    }
    Value operator()(const PropertyDictionary& dictionary) const { return objectOf(dictionary); }
};

PropertyDictionary dictionaryFrom(const Object& object);

/// Properties have neither null nor real numbers: null is left out of its container, a real one is cut.
struct ToProperty {
    using Result = std::optional<PropertyValue>;

    Result operator()(std::monostate) const { return std::nullopt; }
    Result operator()(bool flag) const { return flag; }
    Result operator()(std::int64_t number) const { return number; }
    Result operator()(double number) const {
        constexpr double kLimit = 9.2e18;
        return static_cast<std::int64_t>(std::isnan(number) ? 0 : std::clamp(number, -kLimit, kLimit));
    }
    Result operator()(const std::string& text) const { return text; }
    Result operator()(const Array& array) const {
        PropertyArray properties;
        for (const auto& value : array)
            if (auto property = std::visit(*this, value))
                properties.push_back(*std::move(property));
        return properties;
    }
    Result operator()(const Object& object) const { return dictionaryFrom(object); }
};

PropertyDictionary dictionaryFrom(const Object& object) {
    PropertyDictionary dictionary;
    for (const auto& [key, value] : object)
        if (auto property = std::visit(ToProperty{}, value))
            dictionary.insert_or_assign(key, *std::move(property));
    return dictionary;
}

}  // namespace

Value valueOf(const PropertyValue& property) {
    return std::visit(ToValue{}, property);
}

Object objectOf(const PropertyDictionary& dictionary) {
    Object object;
    for (const auto& [key, property] : dictionary)
        object.emplace_back(key, valueOf(property));
    return object;
}

Object objectOf(const PPDRecord& record) {
    return objectOf(dictionaryFromRecord(record));
}

PPDRecord recordFrom(const Object& object) {
    return recordFromDictionary(dictionaryFrom(object));
}

std::optional<std::vector<PPDRecord>> recordsFromJson(std::string_view text) {
    const auto value = parseJson(text);
    const auto* array = value ? std::get_if<Array>(&*value) : nullptr;
    if (array == nullptr)
        return std::nullopt;
    std::vector<PPDRecord> records;
    for (const auto& element : *array) {
        const auto* object = std::get_if<Object>(&element);
        if (object == nullptr)
            return std::nullopt;
        records.push_back(recordFrom(*object));
    }
    return records;
}

std::string_view describeKind(unsigned kind) {
    static constexpr std::array<std::string_view, 11> kTexts{
        "secure driverless",
        "driverless",
        "installed, localized",
        "installed",
        "can be downloaded",
        "can be downloaded, with conflicts",
        "installed, hpijs",
        "the scheduler's, localized",
        "the scheduler's",
        "Tioga",
        "no driver",
    };
    return kTexts.at(kind);
}

}  // namespace ventras
