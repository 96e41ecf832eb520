#pragma once

#include <gio/gio.h>

#include <memory>

namespace ventras {

namespace detail {
struct UnrefGObject {
    void operator()(gpointer object) const { g_object_unref(object); }
};
struct UnrefVariant {
    void operator()(GVariant* variant) const { g_variant_unref(variant); }
};
struct FreeGError {
    void operator()(GError* error) const { g_error_free(error); }
};
struct FreeGText {
    void operator()(gchar* text) const { g_free(text); }
};
}  // namespace detail

/// Owners of GLib's handles.
template <class Object>
using GObjectPtr = std::unique_ptr<Object, detail::UnrefGObject>;
using VariantPtr = std::unique_ptr<GVariant, detail::UnrefVariant>;
using GErrorPtr = std::unique_ptr<GError, detail::FreeGError>;
using GTextPtr = std::unique_ptr<gchar, detail::FreeGText>;

}  // namespace ventras
