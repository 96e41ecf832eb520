#pragma once

#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// The user's preferences, one set of keys a domain. Main thread only.
class PreferenceStore {
public:
    virtual ~PreferenceStore() = default;

    /// Stores a value for the current user on any host, replacing the old one; a failure is not reported.
    virtual void setValue(std::string_view domain, std::string_view key, const PropertyValue& value) = 0;
};

}  // namespace ventras
