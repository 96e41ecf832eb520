#pragma once

#include "platform/PropertyValue.h"
#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// A dictionary as D-Bus carries it, type a{sv}: booleans b, integers x, texts s, arrays av, dictionaries
/// a{sv}. Broken UTF-8 in a text is replaced, D-Bus does not carry it.
/// @return a floating reference, never null.
GVariant* variantFromDictionary(const PropertyDictionary& dictionary);

/// The dictionary in a variant of type a{sv}. Values of kinds that a PropertyValue cannot hold are left out.
PropertyDictionary dictionaryFromVariant(GVariant* variant);

}  // namespace ventras
