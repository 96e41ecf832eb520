#include "ctl/Json.h"

#include <nlohmann/json.hpp>

namespace ventras {
namespace {

using Json = nlohmann::ordered_json;

// The commands' own input is at most an array of records; this bounds the recursion below.
constexpr int kDeepest = 32;

struct Writer {
    Json operator()(std::monostate) const { return nullptr; }
    Json operator()(bool flag) const { return flag; }
    Json operator()(std::int64_t number) const { return number; }
    Json operator()(double number) const { return number; }
    Json operator()(const std::string& text) const { return text; }
    Json operator()(const Array& array) const {
        Json json = Json::array();
        for (const auto& value : array)
            json.push_back(std::visit(*this, value));
        return json;
    }
    Json operator()(const Object& object) const {
        Json::object_t json;
        for (const auto& [key, value] : object)
            json.emplace_back(key, std::visit(*this, value));
        return json;
    }
};

std::optional<Value> read(const Json& json, int depth);

std::optional<Value> readArray(const Json& json, int depth) {
    Array array;
    for (const auto& element : json) {
        auto value = read(element, depth + 1);
        if (!value)
            return std::nullopt;
        array.push_back(*std::move(value));
    }
    return array;
}

std::optional<Value> readObject(const Json& json, int depth) {
    Object object;
    for (const auto& [key, element] : json.items()) {
        auto value = read(element, depth + 1);
        if (!value)
            return std::nullopt;
        object.emplace_back(key, *std::move(value));
    }
    return object;
}

std::optional<Value> read(const Json& json, int depth) {
    if (depth > kDeepest)
        return std::nullopt;
    switch (json.type()) {
        case Json::value_t::null:
            return Value{};
        case Json::value_t::boolean:
            return json.get<bool>();
        case Json::value_t::number_integer:
            return json.get<std::int64_t>();
        case Json::value_t::number_unsigned:
        case Json::value_t::number_float:
            // Numbers that are too large for 64 bits with a sign stay near enough as real ones.
            if (json.is_number_unsigned() && json.get<std::uint64_t>() <= INT64_MAX)
                return json.get<std::int64_t>();
            return json.get<double>();
        case Json::value_t::string:
            return json.get_ref<const std::string&>();
        case Json::value_t::array:
            return readArray(json, depth);
        case Json::value_t::object:
            return readObject(json, depth);
        default:
            return std::nullopt;
    }
}

// JSON lets DEL and the C1 control characters stand as they are, but people look at it on terminals, which
// obey them. Outside of texts there are none.
std::string withEscapedControls(std::string_view json) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    std::string escaped;
    for (std::size_t i = 0; i < json.size(); ++i) {
        auto byte = static_cast<unsigned char>(json[i]);
        const bool leadsToC1 =
            byte == 0xC2 && i + 1 < json.size() && static_cast<unsigned char>(json[i + 1]) < 0xA0;
        if (leadsToC1)
            byte = static_cast<unsigned char>(json[++i]);
        if (leadsToC1 || byte == 0x7F)
            escaped.append("\\u00").append({kDigits[byte >> 4U], kDigits[byte & 15U]});
        else
            escaped += json[i];
    }
    return escaped;
}

}  // namespace

std::string toJson(const Value& value) {
    return withEscapedControls(
        std::visit(Writer{}, value).dump(-1, ' ', false, Json::error_handler_t::replace));
}

std::optional<Value> parseJson(std::string_view text) {
    const auto json = Json::parse(text, nullptr, false);
    return json.is_discarded() ? std::nullopt : read(json, 0);
}

}  // namespace ventras
