#include "drivers/GenericDrivers.h"

#include <algorithm>
#include <string>
#include <utility>

#include "deviceid/TextScan.h"
#include "drivers/PPDParser.h"
#include "platform/ResourceBundle.h"

namespace ventras {
namespace {

constexpr std::string_view kSchedulersPostscript = "drv:///sample.drv/generic.ppd";
constexpr std::string_view kSchedulersPCL = "drv:///sample.drv/generpcl.ppd";

}  // namespace

GenericDrivers::GenericDrivers(const ResourceBundle& resources, Catalogue catalogue)
    : resources_(resources), catalogue_(std::move(catalogue)) {}

PPDRecord GenericDrivers::postscript() {
    return once(postscript_, [this] {
        auto found = inCatalogue(kSchedulersPostscript);
        return found ? *std::move(found) : system("Generic");
    });
}

PPDRecord GenericDrivers::pcl() {
    return once(pcl_, [this] { return inCatalogue(kSchedulersPCL).value_or(PPDRecord{}); });
}

PPDRecord GenericDrivers::fax() {
    return once(fax_, [this] { return system("Fax"); });
}

PPDRecord GenericDrivers::urf() {
    return once(urf_, [this] { return system("Vellum"); });
}

PPDRecord GenericDrivers::system(std::string_view name) const {
    const auto path = resources_.pathForResource(name, "ppd");
    if (!path)
        throw InternalInconsistencyError(std::string(name) + " PPD missing from '" + resources_.name() +
                                         "' bundle");
    auto record = parsePPDFile(*path);
    if (!record)
        throw InternalInconsistencyError("Unable to parse " + std::string(name) + " ppd.");
    return *std::move(record);
}

template <typename Find>
PPDRecord GenericDrivers::once(Slot& slot, Find find) {
    const std::scoped_lock lock(slot.mutex);
    if (!slot.record)
        slot.record = find();
    return *slot.record;
}

std::optional<PPDRecord> GenericDrivers::inCatalogue(std::string_view name) const {
    auto records = catalogue_();
    const auto found = std::ranges::find_if(records, [&](const auto& record) {
        return record.name && TextScan::equalsIgnoringCase(*record.name, name);
    });
    if (found == records.end())
        return std::nullopt;
    return std::move(*found);
}

}  // namespace ventras
