#pragma once

#include <ostream>

#include "platform/PropertyValue.h"

namespace ventras {

void PrintTo(const PropertyValue& value, std::ostream* out);

/// Writes a value for the messages of failed tests; GoogleTest finds it by its name.
struct PropertyValuePrinter {
    std::ostream& out;

    void operator()(bool flag) const { out << (flag ? "true" : "false"); }
    void operator()(std::int64_t number) const { out << number; }
    void operator()(const std::string& text) const { out << '"' << text << '"'; }
    void operator()(const PropertyArray& array) const {
        out << "[ ";
        for (const auto& value : array) {
            PrintTo(value, &out);
            out << ' ';
        }
        out << ']';
    }
    void operator()(const PropertyDictionary& dictionary) const {
        out << "{ ";
        for (const auto& [key, value] : dictionary) {
            out << key << '=';
            PrintTo(value, &out);
            out << ' ';
        }
        out << '}';
    }
};

inline void PrintTo(const PropertyValue& value, std::ostream* out) {
    std::visit(PropertyValuePrinter{*out}, value);
}

}  // namespace ventras
