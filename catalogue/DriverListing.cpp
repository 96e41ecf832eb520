#include "catalogue/DriverListing.h"

#include <algorithm>
#include <array>

#include "catalogue/CatalogueFormat.h"
#include "catalogue/ScanIDKey.h"
#include "deviceid/PMStringAdditions.h"
#include "deviceid/TextScan.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

constexpr auto kFoomatic = " Foomatic/"sv;

// Where a model ends in a driver's name, and the driver's own name, its version or its language begins.
constexpr std::array kModelEnds{", "sv,          " - CUPS+"sv,   kFoomatic, " (recommended)"sv,
                                " PostScript"sv, " Postscript"sv};

/// Takes the text between the next two quotation marks.
std::optional<std::string> takeQuoted(std::string_view& line) {
    const auto start = line.find('"');
    const auto end = start == std::string_view::npos ? start : line.find('"', start + 1);
    if (end == std::string_view::npos)
        return std::nullopt;
    std::string text(line.substr(start + 1, end - start - 1));
    line.remove_prefix(end + 1);
    return text;
}

std::string_view modelIn(std::string_view makeAndModel) {
    auto end = makeAndModel.size();
    for (const auto mark : kModelEnds)
        end = std::min(end, makeAndModel.find(mark));
    return TextScan::trimmed(makeAndModel.substr(0, end));
}

std::optional<std::string> usableTag(std::optional<std::string> tag) {
    return tag && scanIDKey(*tag) && CatalogueFormat::isPlainText(*tag) ? tag : std::nullopt;
}

}  // namespace

std::optional<ListedDriver> driverFromListing(std::string_view line) {
    const auto uri = takeQuoted(line);
    auto make = takeQuoted(line);
    auto makeAndModel = takeQuoted(line);
    if (!uri || !make || !makeAndModel)
        return std::nullopt;
    return ListedDriver{*std::move(make), *std::move(makeAndModel), takeQuoted(line).value_or("")};
}

std::optional<std::string> deviceTag(const ListedDriver& driver) {
    if (auto tag = usableTag(PMStringAdditions::softwareUpdateScaneID(driver.deviceID)))
        return tag;
    const auto named = "MANUFACTURER:" + driver.make + ";MODEL:" + std::string(modelIn(driver.makeAndModel));
    return usableTag(PMStringAdditions::softwareUpdateScaneID(named));
}

std::string_view foomaticDriver(const ListedDriver& driver) {
    const std::string_view name = driver.makeAndModel;
    const auto start = name.find(kFoomatic);
    if (start == std::string_view::npos)
        return {};
    const auto rest = name.substr(start + kFoomatic.size());
    return rest.substr(0, rest.find(' '));
}

}  // namespace ventras
