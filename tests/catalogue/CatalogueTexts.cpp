#include "tests/catalogue/CatalogueTexts.h"

#include "platform/PropertyList.h"

namespace ventras {

PropertyDictionary packageEntry(std::int64_t tier, const std::vector<std::string>& tags) {
    return {{"title", "A driver"},
            {"version", "1.0-1"},
            {"tier", tier},
            {"tags", PropertyArray(tags.begin(), tags.end())}};
}

PropertyDictionary catalogueContent(PropertyDictionary packages) {
    return {{"format", std::int64_t{1}}, {"release", "debian 12"}, {"packages", std::move(packages)}};
}

std::string textOf(const PropertyDictionary& content) {
    return xmlPropertyList(content).value();
}

std::string smallCatalogue(std::string_view release) {
    auto content = catalogueContent(
        {{"laser-driver",
          packageEntry(0, {"MANUFACTURER:HP;MODEL:LaserJet 4", "MANUFACTURER:HP;MODEL:LaserJet 6"})},
         {"other-laser-driver", packageEntry(0, {"MANUFACTURER:Hewlett-Packard;MODEL:HP LaserJet 6"})},
         {"ink-driver", packageEntry(0, {"MANUFACTURER:EPSON;MODEL:Stylus C80", "printer update"})},
         {"collection",
          packageEntry(2, {"MANUFACTURER:HP;MODEL:LaserJet 4", "MANUFACTURER:HP;MODEL:LaserJet 5"})}});
    content.insert_or_assign("release", release);
    return textOf(content);
}

}  // namespace ventras
