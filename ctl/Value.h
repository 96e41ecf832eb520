#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace ventras {

struct Value;
using Array = std::vector<Value>;

/// Members in the order in which they are to be printed.
using Object = std::vector<std::pair<std::string, Value>>;

/// What a command has found out, before it is decided whether people or a program will read it; and what was
/// read from JSON. Null stands for what is not known. Texts may hold any bytes.
struct Value : std::variant<std::monostate, bool, std::int64_t, double, std::string, Array, Object> {
    using variant::variant;
    Value(const char* text) : variant(std::string(text)) {}
    Value(std::string_view text) : variant(std::string(text)) {}

    /// Null for what is absent.
    template <typename T>
    Value(const std::optional<T>& value) {
        if (value)
            *this = Value(*value);
    }

    Value(const std::vector<std::string>& texts) : variant(Array(texts.begin(), texts.end())) {}

    bool isNull() const { return std::holds_alternative<std::monostate>(*this); }
};

/// The member under `key`; null pointer when there is none.
inline const Value* find(const Object& object, std::string_view key) {
    for (const auto& [name, value] : object)
        if (name == key)
            return &value;
    return nullptr;
}

}  // namespace ventras
