#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <variant>

#include "catalogue/PackageSelection.h"
#include "download/DownloadTriggerOperation.h"
#include "fuzz/Require.h"
#include "platform/TagPredicate.h"

// Device IDs go into the text of a predicate as they stand. Whatever they hold, no predicate may select a
// package that is for none of the devices that it names.

namespace {

using namespace ventras;

const DriverCatalogue& catalogue() {
    static const DriverCatalogue kCatalogue(
        "debian 12", {{.name = "one", .tags = {"MANUFACTURER:A;MODEL:1"}},
                      {.name = "two", .tags = {"MANUFACTURER:B;MODEL:2", "printer update"}}});
    return kCatalogue;
}

bool selectsAny(const std::string& predicate) {
    const auto selection = selectPackages(catalogue(), predicate);
    const auto* packages = std::get_if<DriverCatalogue::Packages>(&selection);
    return packages != nullptr && !packages->empty();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text{reinterpret_cast<const char*>(data), size};
    if (const auto predicate = TagPredicate::parse(text)) {
        require(!predicate->holds([](const std::string&) { return false; }));
        require(predicate->holds([](const std::string&) { return true; }));
    }
    selectsAny(text);

    // A device that names neither maker cannot have a package selected: their tags need these letters.
    if (const auto predicate = DownloadTriggerOperation::predicateForUpdateString(text))
        if (text.find_first_of("AaBb") == std::string::npos)
            require(!selectsAny(*predicate));
    return 0;
}
