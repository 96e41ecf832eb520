#include "catalogue/PackageSelection.h"

#include <gtest/gtest.h>

#include "download/DownloadTriggerOperation.h"
#include "tests/catalogue/CatalogueTexts.h"

namespace ventras {
namespace {

using IDs = std::vector<std::string>;

/// The names of the packages, blank-separated; or the error.
std::string selectedBy(const std::string& predicate, const DriverCatalogue& catalogue) {
    const auto selection = selectPackages(catalogue, predicate);
    if (const auto* error = std::get_if<SelectionError>(&selection))
        return std::string(describe(*error));
    std::string names;
    for (const auto* package : std::get<DriverCatalogue::Packages>(selection))
        names.append(names.empty() ? "" : " ").append(package->name);
    return names;
}

std::string selectedFor(const IDs& scanIDs) {
    const auto catalogue = DriverCatalogue::parse(smallCatalogue());
    const auto predicate = DownloadTriggerOperation::predicateForUpdateStrings(scanIDs);
    return selectedBy(predicate.value(), catalogue.catalogue.value());
}

std::string selectedBy(const std::string& predicate) {
    return selectedBy(predicate, DriverCatalogue::parse(smallCatalogue()).catalogue.value());
}

const std::string kLaserJet4 = "MANUFACTURER:HP;MODEL:LaserJet 4";
const std::string kLaserJet5 = "MANUFACTURER:HP;MODEL:LaserJet 5";
const std::string kStylus = "MANUFACTURER:EPSON;MODEL:Stylus C80";

TEST(PackageSelection, TakesExactlyThePackageForTheDevice) {
    EXPECT_EQ(selectedFor({kLaserJet4}), "laser-driver");
    EXPECT_EQ(selectedFor({kLaserJet5}), "collection");
    EXPECT_EQ(selectedFor({kStylus}), "ink-driver");
    EXPECT_EQ(selectedFor({"MANUFACTURER:hewlett-packard;MODEL:HP LASERJET  4"}), "laser-driver");
}

TEST(PackageSelection, TakesOnePackageForEachOfSeveralDevices) {
    EXPECT_EQ(selectedFor({kStylus, kLaserJet5}), "ink-driver collection");
    EXPECT_EQ(selectedFor({kLaserJet4, kLaserJet4}), "laser-driver");
    EXPECT_EQ(selectedFor({kLaserJet4, "MANUFACTURER:HP;MODEL:none"}), "laser-driver");
}

TEST(PackageSelection, TakesNothingForAModelThatNoPackageIsFor) {
    for (const std::string model : {"LaserJet", "LaserJet 4L", "LaserJet 44", "%", "*", "printing software"})
        EXPECT_EQ(selectedFor({"MANUFACTURER:HP;MODEL:" + model}), "") << model;
    EXPECT_EQ(selectedFor({"MANUFACTURER:Acme;MODEL:LaserJet 4"}), "");
    EXPECT_EQ(selectedFor({"MANUFACTURER:HP;MODEL:" + std::string(10'000, 'x')}), "");
}

// Without the parentheses around the kinds of software, AND would bind to the second kind only.
TEST(PackageSelection, RefusesAPredicateThatIsGroupedWrongly) {
    const std::string wrong =
        R"(("printing software" in tags ) OR ("printer update" in tags ) AND ("MANUFACTURER:HP;MODEL:none" IN tags))";
    EXPECT_EQ(selectedBy(wrong), "the predicate holds whatever the device");
    const std::string right =
        R"((("printing software" in tags ) OR ("printer update" in tags )) AND ("MANUFACTURER:HP;MODEL:none" IN tags))";
    EXPECT_EQ(selectedBy(right), "");
}

TEST(PackageSelection, RefusesIDsThatWouldSelectEveryPackage) {
    for (const std::string id :
         {R"(x" IN tags) OR ("printing software)", R"(x" IN tags) OR ("printer update)", "printing software",
          R"(x" IN tags OR "printing software)"})
        EXPECT_EQ(selectedFor({id}), "the predicate holds whatever the device") << id;
}

TEST(PackageSelection, RefusesWhatIsNoCondition) {
    for (const std::string id : {"\"", "a\"b", "\") OR (", "((((\"", "\" IN tags))) --", "x\" AND \"y"})
        EXPECT_EQ(selectedFor({id}), "the predicate cannot be read") << id;
    for (const std::string predicate : {"", "printing software", "\"printing software\"", "(((", "TRUE"})
        EXPECT_EQ(selectedBy(predicate), "the predicate cannot be read") << predicate;
}

TEST(PackageSelection, TakesAnIDThatNamesAnotherDeviceForThatDevice) {
    EXPECT_EQ(selectedFor({"x\" IN tags) OR (\"" + kStylus}), "the predicate holds whatever the device");
    EXPECT_EQ(selectedFor({kLaserJet5 + "\" IN tags) OR (\"" + kStylus}), "ink-driver collection");
}

TEST(PackageSelection, ReadsPackagesOwnKindsOfSoftware) {
    const std::string device = "(\"" + kStylus + "\" IN tags)";
    EXPECT_EQ(selectedBy(device + " AND (\"printer update\" in tags)"), "ink-driver");
    EXPECT_EQ(selectedBy("(\"" + kLaserJet4 + "\" IN tags) AND (\"printer update\" in tags)"), "");
}

TEST(PackageSelection, TakesAllOfEquallyGoodPackages) {
    EXPECT_EQ(selectedFor({"MANUFACTURER:HP;MODEL:LaserJet 6"}), "laser-driver other-laser-driver");
}

}  // namespace
}  // namespace ventras
