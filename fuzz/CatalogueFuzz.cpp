#include <cstddef>
#include <cstdint>
#include <string_view>

#include "catalogue/CatalogueBuilder.h"
#include "catalogue/CatalogueFormat.h"
#include "catalogue/DriverCatalogue.h"
#include "fuzz/Require.h"

// A catalogue file names packages that are going to be installed. What can be read keeps the rules of the
// format, finds each package under its own tags, and is the same when it is written and read again.

namespace {

using namespace ventras;

void check(const DriverCatalogue& catalogue) {
    std::size_t tags = 0;
    for (const auto& package : catalogue.packages()) {
        require(CatalogueFormat::isPackageName(package.name));
        for (const auto& tag : package.tags) {
            require(CatalogueFormat::isPlainText(tag));
            const auto best = catalogue.packagesFor(tag, PackageScope::AlsoDriverless);
            require(best.empty() || best.front()->tier <= package.tier);
            ++tags;
        }
    }
    require(catalogue.coverage().resolved <= catalogue.coverage().devices);
    require(catalogue.coverage().devices <= tags);
    const auto text = catalogueText(catalogue);
    require(text && DriverCatalogue::parse(*text).catalogue->packages() == catalogue.packages());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto reading = DriverCatalogue::parse({reinterpret_cast<const char*>(data), size});
    require(reading.catalogue.has_value() == reading.fault.empty());
    if (reading.catalogue)
        check(*reading.catalogue);
    return 0;
}
