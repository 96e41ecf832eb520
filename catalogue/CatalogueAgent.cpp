#include "catalogue/CatalogueAgent.h"

#include <utility>

#include "platform/Log.h"
#include "platform/PrintToolAgentChannel.h"

namespace ventras {
namespace {

using namespace PrintToolAgentKeys;

// Longer than any device ID: IEEE 1284 tells its length in 16 bits.
constexpr std::size_t kLongestScanID = 65536;

PackageScope scopeOf(const PropertyDictionary& arguments) {
    const auto vellum = arguments.find(kVellum);
    const auto* flag = vellum == arguments.end() ? nullptr : std::get_if<bool>(&vellum->second);
    return flag != nullptr && *flag ? PackageScope::AlsoDriverless : PackageScope::DeviceDrivers;
}

PropertyArray namesOf(const DriverCatalogue::Packages& packages) {
    PropertyArray names;
    for (const auto* package : packages)
        names.emplace_back(package->name);
    return names;
}

}  // namespace

CatalogueAgent::CatalogueAgent(std::filesystem::path file, std::string thisRelease, Log& log)
    : file_(std::move(file)), thisRelease_(std::move(thisRelease)), log_(log) {}

const DriverCatalogue* CatalogueAgent::catalogue() {
    if (!reading_) {
        reading_ = DriverCatalogue::read(file_);
        if (!reading_->catalogue)
            log_.error("driver packages cannot be looked up: " + reading_->fault);
    }
    return reading_->catalogue ? &*reading_->catalogue : nullptr;
}

std::optional<PropertyDictionary> CatalogueAgent::answer(std::uint32_t command,
                                                         const PropertyDictionary& arguments) {
    const auto* scanID = findText(arguments, kScanID);
    if (command != PrintToolAgentChannel::kCountDriverPackages || scanID == nullptr ||
        scanID->size() > kLongestScanID)
        return std::nullopt;
    const auto* known = catalogue();
    if (known == nullptr)
        return PropertyDictionary{{kCount, std::int64_t{0}}, {kIsCacheCurrent, false}};
    const auto packages = known->packagesFor(*scanID, scopeOf(arguments));
    PropertyDictionary reply{{kCount, static_cast<std::int64_t>(packages.size())},
                             {kIsCacheCurrent, known->release() == thisRelease_}};
    if (packages.size() > 1)
        reply.emplace(kConflicts, namesOf(packages));
    return reply;
}

}  // namespace ventras
