#include "platform/PropertyList.h"

#include <plist/plist.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <type_traits>

#include "platform/Utf8.h"

namespace ventras {
namespace {

using PlistPtr =
    std::unique_ptr<std::remove_pointer_t<plist_t>, decltype([](plist_t node) { plist_free(node); })>;
using PlistText = std::unique_ptr<char, decltype([](char* text) { std::free(text); })>;

// Deeper nesting than this comes from no one who means well.
constexpr int kDeepest = 64;

// libplist recurses as deep as the data nests, before we see any of it; so many containers cannot nest deep
// enough to exhaust a stack.
constexpr std::size_t kLongest = std::size_t{4} * 1024 * 1024;
constexpr std::size_t kMostContainers = 64 * 1024;

// The binary form stays outside: a NUL in one of its UTF-16 keys makes libplist abort the process, and nobody
// who writes lists for us uses it.
constexpr std::string_view kBinaryForm = "bplist";

std::size_t countOf(std::string_view wanted, std::string_view text) {
    std::size_t count = 0;
    for (auto found = text.find(wanted); found != std::string_view::npos;
         found = text.find(wanted, found + 1))
        ++count;
    return count;
}

bool isReasonable(std::string_view text) {
    return !text.starts_with(kBinaryForm) && text.size() <= kLongest &&
           text.find('\0') == std::string_view::npos &&
           countOf("<array", text) + countOf("<dict", text) <= kMostContainers;
}

bool fitsXml(std::string_view text) {
    const auto isForbidden = [](char c) {
        return static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n' && c != '\r';
    };
    return isValidUtf8(text) && std::ranges::none_of(text, isForbidden);
}

struct Builder {
    plist_t operator()(bool flag) const { return plist_new_bool(flag ? 1 : 0); }
    plist_t operator()(std::int64_t number) const {
        return plist_new_uint(static_cast<std::uint64_t>(number));
    }
    plist_t operator()(const std::string& text) const {
        return fitsXml(text) ? plist_new_string(text.c_str()) : nullptr;
    }
    plist_t operator()(const PropertyArray& array) const {
        PlistPtr node{plist_new_array()};
        for (const auto& value : array) {
            const plist_t item = std::visit(*this, value);
            if (item == nullptr)
                return nullptr;
            plist_array_append_item(node.get(), item);
        }
        return node.release();
    }
    plist_t operator()(const PropertyDictionary& dictionary) const {
        PlistPtr node{plist_new_dict()};
        for (const auto& [key, value] : dictionary) {
            const plist_t item = fitsXml(key) ? std::visit(*this, value) : nullptr;
            if (item == nullptr)
                return nullptr;
            plist_dict_set_item(node.get(), key.c_str(), item);
        }
        return node.release();
    }
};

std::optional<PropertyValue> read(plist_t node, int depth);

std::optional<PropertyValue> readArray(plist_t node, int depth) {
    PropertyArray array;
    for (std::uint32_t i = 0; i < plist_array_get_size(node); ++i)
        if (auto value = read(plist_array_get_item(node, i), depth + 1))
            array.push_back(std::move(*value));
    return array;
}

std::optional<PropertyValue> readDictionary(plist_t node, int depth) {
    PropertyDictionary dictionary;
    plist_dict_iter iterator = nullptr;
    plist_dict_new_iter(node, &iterator);
    const PlistText owner{static_cast<char*>(iterator)};
    for (;;) {
        char* key = nullptr;
        plist_t item = nullptr;
        plist_dict_next_item(node, iterator, &key, &item);
        const PlistText keyOwner{key};
        if (item == nullptr)
            return dictionary;
        if (auto value = read(item, depth + 1))
            dictionary.insert_or_assign(key, std::move(*value));
    }
}

std::optional<PropertyValue> read(plist_t node, int depth) {
    if (depth > kDeepest)
        return std::nullopt;
    switch (plist_get_node_type(node)) {
        case PLIST_BOOLEAN: {
            std::uint8_t flag = 0;
            plist_get_bool_val(node, &flag);
            return flag != 0;
        }
        case PLIST_UINT: {
            std::uint64_t number = 0;
            plist_get_uint_val(node, &number);
            return static_cast<std::int64_t>(number);
        }
        case PLIST_STRING: {
            // Asked for a copy, libplist aborts the process when the text holds a NUL.
            std::uint64_t length = 0;
            const char* text = plist_get_string_ptr(node, &length);
            if (text == nullptr || std::strlen(text) != length)
                return std::nullopt;
            return PropertyValue{std::string_view(text, length)};
        }
        case PLIST_ARRAY:
            return readArray(node, depth);
        case PLIST_DICT:
            return readDictionary(node, depth);
        default:
            return std::nullopt;
    }
}

}  // namespace

std::optional<std::string> xmlPropertyList(const PropertyValue& value) {
    const PlistPtr root{std::visit(Builder{}, value)};
    if (!root)
        return std::nullopt;
    char* text = nullptr;
    std::uint32_t length = 0;
    plist_to_xml(root.get(), &text, &length);
    const PlistText owner{text};
    if (text == nullptr)
        return std::nullopt;
    return std::string(text, length);
}

std::optional<PropertyValue> parsePropertyList(std::string_view data) {
    if (!isReasonable(data))
        return std::nullopt;
    plist_t node = nullptr;
    plist_from_xml(data.data(), static_cast<std::uint32_t>(data.size()), &node);
    const PlistPtr root{node};
    return root ? read(root.get(), 0) : std::nullopt;
}

}  // namespace ventras
