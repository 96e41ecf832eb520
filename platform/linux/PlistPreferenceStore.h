#pragma once

#include <filesystem>
#include <optional>

#include "platform/PreferenceStore.h"

namespace ventras {

class Log;

/// The user's configuration folder (XDG Base Directory Specification); empty when nobody has a home.
std::filesystem::path userConfigurationFolder();

/// Preferences as one XML property list a domain, "DOMAIN.plist", replaced as a whole so that readers never
/// see half a file. A file that does not parse is kept aside as "DOMAIN.plist.bad". Main thread only.
class PlistPreferenceStore : public PreferenceStore {
public:
    /// @param log outlives the store
    PlistPreferenceStore(std::filesystem::path folder, Log& log) : folder_(std::move(folder)), log_(log) {}

    void setValue(std::string_view domain, std::string_view key, const PropertyValue& value) override;

    /// The value stored under a key; absent when there is none, or no readable file. Any thread may ask.
    std::optional<PropertyValue> value(std::string_view domain, std::string_view key) const;

private:
    std::filesystem::path folder_;
    Log& log_;
};

}  // namespace ventras
