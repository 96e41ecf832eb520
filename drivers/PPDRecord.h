#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/PropertyValue.h"

namespace ventras {

/// What is known of one driver. An absent field is not known; the name of a field's dictionary key stands
/// behind it.
///
/// Records come from a PPD file on disk, from the scheduler's catalogue, and from the software-update
/// catalogue.
struct PPDRecord {
    std::optional<std::string> name;          ///< "ppd_name": file path, server name or URI
    std::optional<std::string> make;          ///< "ppd_make"
    std::optional<std::string> makeAndModel;  ///< "ppd_make_and_model"
    std::vector<std::string> product;         ///< "ppd_product"; absent when empty
    std::optional<std::string> deviceID;      ///< "ppd_device_id": IEEE 1284 device ID
    std::optional<std::string> modelNumber;   ///< "ppd_model_number"
    std::optional<std::string> type;          ///< "ppd_type": "fax", "postscript", "raster", ...
    std::vector<std::string> filters;         ///< "ppd_filters", last first; absent when empty
    std::optional<std::vector<std::string>> naturalLanguage;  ///< "ppd_natural_language"
    std::optional<std::int64_t> languageLevel;                ///< "ppd_language_level": PostScript level
    std::optional<bool> color;                                ///< "ppd_color"
    std::optional<std::int64_t> throughput;                   ///< "ppd_throughput": pages per minute
    std::optional<std::string> fileVersion;                   ///< "ppd_file_version"
    std::optional<std::string> languageVersion;               ///< "ppd_language_version"
    std::optional<std::string> iconPath;                      ///< "ppd_iconpath"
    std::optional<std::string> inkTool;                       ///< "ppd_inktool"
    std::optional<std::string> cupsCommands;                  ///< "ppd_cups_commands"
    std::vector<std::string> psVersion;                       ///< "ppd_psversion"; absent when empty
    std::vector<std::string> pdes;                   ///< "ppd_pdes": dialog extensions; absent when empty
    std::optional<bool> secureVellum;                ///< "ppd_secure_vellum"
    std::optional<PropertyValue> suDriverPredicate;  ///< "KioskoSUDriverPredicateStr"
    std::optional<PropertyValue> suDriverConflicts;  ///< "kKioskoSUDriverConflicts"
    std::optional<PropertyValue> suCacheCurrent;     ///< "KioskoSUCacheCurrent"
    std::optional<std::string> driverName;           ///< "KioskoDriverName": tie-break when sorting

    bool operator==(const PPDRecord&) const = default;
};

/// The record under its dictionary keys; absent fields leave their keys out.
PropertyDictionary dictionaryFromRecord(const PPDRecord& record);

/// The record that a dictionary describes; unknown keys, and values of a kind that a field cannot hold, are
/// left out.
PPDRecord recordFromDictionary(const PropertyDictionary& dictionary);

}  // namespace ventras
