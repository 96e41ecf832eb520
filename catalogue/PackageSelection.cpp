#include "catalogue/PackageSelection.h"

#include "catalogue/ScanIDKey.h"
#include "platform/TagPredicate.h"

namespace ventras {
namespace {

// A condition has no negation, so one that holds without any device's tag holds with all of them as well.
bool holdsWithoutDevice(const TagPredicate& condition) {
    return condition.holds([](const std::string& tag) { return !scanIDKey(tag); });
}

}  // namespace

std::string_view describe(SelectionError error) {
    switch (error) {
        case SelectionError::Malformed:
            return "the predicate cannot be read";
        case SelectionError::NamesNoDevice:
            return "the predicate holds whatever the device";
    }
    return "unknown";
}

PackageSelection selectPackages(const DriverCatalogue& catalogue, std::string_view predicate) {
    const auto condition = TagPredicate::parse(predicate);
    if (!condition)
        return SelectionError::Malformed;
    if (holdsWithoutDevice(*condition))
        return SelectionError::NamesNoDevice;
    DriverCatalogue::Packages selected;
    for (const auto& package : catalogue.packages())
        if (condition->holds([&](const std::string& tag) { return catalogue.hasTag(package, tag); }))
            selected.push_back(&package);
    return selected;
}

}  // namespace ventras
