#include "platform/linux/desktop/PropertyVariant.h"

#include <optional>

#include "platform/Utf8.h"

namespace ventras {
namespace {

GVariant* textVariant(const std::string& text) {
    if (isValidUtf8(text))
        return g_variant_new_string(text.c_str());
    return g_variant_new_take_string(g_utf8_make_valid(text.data(), static_cast<gssize>(text.size())));
}

struct ToVariant {
    GVariant* operator()(bool flag) const { return g_variant_new_boolean(flag ? TRUE : FALSE); }
    GVariant* operator()(std::int64_t number) const { return g_variant_new_int64(number); }
    GVariant* operator()(const std::string& text) const { return textVariant(text); }
    GVariant* operator()(const PropertyArray& array) const {
        GVariantBuilder builder;
        g_variant_builder_init(&builder, G_VARIANT_TYPE("av"));
        for (const auto& value : array)
            g_variant_builder_add(&builder, "v", std::visit(*this, value));
        return g_variant_builder_end(&builder);
    }
    GVariant* operator()(const PropertyDictionary& dictionary) const {
        return variantFromDictionary(dictionary);
    }
};

std::optional<PropertyValue> valueFromVariant(GVariant* variant);

PropertyArray arrayFromVariant(GVariant* variant) {
    PropertyArray array;
    for (gsize i = 0; i < g_variant_n_children(variant); ++i) {
        const VariantPtr child{g_variant_get_child_value(variant, i)};
        if (auto value = valueFromVariant(child.get()))
            array.push_back(std::move(*value));
    }
    return array;
}

// D-Bus bounds the nesting of what arrives (specification, "Valid signatures"), hence this recursion too.
std::optional<PropertyValue> valueFromVariant(GVariant* variant) {
    switch (g_variant_classify(variant)) {
        case G_VARIANT_CLASS_BOOLEAN:
            return g_variant_get_boolean(variant) != FALSE;
        case G_VARIANT_CLASS_BYTE:
            return std::int64_t{g_variant_get_byte(variant)};
        case G_VARIANT_CLASS_INT16:
            return std::int64_t{g_variant_get_int16(variant)};
        case G_VARIANT_CLASS_UINT16:
            return std::int64_t{g_variant_get_uint16(variant)};
        case G_VARIANT_CLASS_INT32:
            return std::int64_t{g_variant_get_int32(variant)};
        case G_VARIANT_CLASS_UINT32:
            return std::int64_t{g_variant_get_uint32(variant)};
        case G_VARIANT_CLASS_INT64:
            return std::int64_t{g_variant_get_int64(variant)};
        case G_VARIANT_CLASS_UINT64:
            return static_cast<std::int64_t>(g_variant_get_uint64(variant));
        case G_VARIANT_CLASS_STRING:
            return std::string(g_variant_get_string(variant, nullptr));
        case G_VARIANT_CLASS_VARIANT: {
            const VariantPtr inner{g_variant_get_variant(variant)};
            return valueFromVariant(inner.get());
        }
        case G_VARIANT_CLASS_ARRAY:
            if (g_variant_is_of_type(variant, G_VARIANT_TYPE_VARDICT))
                return dictionaryFromVariant(variant);
            return arrayFromVariant(variant);
        default:
            return std::nullopt;
    }
}

}  // namespace

GVariant* variantFromDictionary(const PropertyDictionary& dictionary) {
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_VARDICT);
    for (const auto& [key, value] : dictionary) {
        const VariantPtr name{g_variant_ref_sink(textVariant(key))};
        g_variant_builder_add(&builder, "{sv}", g_variant_get_string(name.get(), nullptr),
                              std::visit(ToVariant{}, value));
    }
    return g_variant_builder_end(&builder);
}

PropertyDictionary dictionaryFromVariant(GVariant* variant) {
    PropertyDictionary dictionary;
    for (gsize i = 0; i < g_variant_n_children(variant); ++i) {
        const VariantPtr entry{g_variant_get_child_value(variant, i)};
        const VariantPtr key{g_variant_get_child_value(entry.get(), 0)};
        const VariantPtr item{g_variant_get_child_value(entry.get(), 1)};
        if (auto value = valueFromVariant(item.get()))
            dictionary.insert_or_assign(g_variant_get_string(key.get(), nullptr), std::move(*value));
    }
    return dictionary;
}

}  // namespace ventras
