#include "catalogue/CatalogueBuilder.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

using Drivers = std::vector<ListedDriver>;

PackageContent package(std::string name, Drivers drivers, std::vector<std::string> brings = {}) {
    return {std::move(name), "1.0", "A title", std::move(brings), std::move(drivers)};
}

DriverCatalogue built(std::vector<PackageContent> packages) {
    CatalogueBuilder builder;
    for (auto& content : packages)
        builder.add(std::move(content));
    return builder.build("debian 12");
}

/// The package that a device resolves to; "a b" for several.
std::string packageFor(const DriverCatalogue& catalogue, const std::string& model) {
    std::string names;
    for (const auto* found : catalogue.packagesFor("MFG:Acme;MDL:" + model))
        names.append(names.empty() ? "" : " ").append(found->name);
    return names;
}

const ListedDriver kX1{"Acme", "Acme X1", "MFG:Acme;MDL:X1;"};
const ListedDriver kX1Loud{"ACME", "ACME X1 Foomatic/other", "MFG:ACME;MDL:ACME  X1;"};

TEST(CatalogueBuilder, PutsCollectionsBehindDriversMadeForTheDevice) {
    const std::string order[] = {"openprinting-ppds", "foomatic-db-compressed-ppds",
                                 "printer-driver-gutenprint", "printer-driver-acme"};
    std::vector<PackageContent> packages;
    for (const auto& name : order) {
        packages.push_back(package(name, {kX1}));
        EXPECT_EQ(packageFor(built(packages), "X1"), name);
    }
    packages.push_back(package("acme-ppds", {kX1}));
    EXPECT_EQ(packageFor(built(packages), "X1"), "acme-ppds printer-driver-acme");
}

TEST(CatalogueBuilder, GivesEachDeviceOneTagInAPackage) {
    const auto catalogue = built({package("printer-driver-acme", {kX1, kX1Loud, kX1})});
    ASSERT_EQ(catalogue.packages().size(), 1U);
    EXPECT_EQ(catalogue.packages().front(), (DriverPackage{.name = "printer-driver-acme",
                                                           .title = "A title",
                                                           .version = "1.0",
                                                           .tags = {"MANUFACTURER:Acme;MODEL:X1"}}));
}

TEST(CatalogueBuilder, LeavesOutSupersededPackagesAndThoseWithoutDevices) {
    const auto catalogue = built({package("hplip-data", {kX1}), package("printer-driver-hpijs", {kX1}),
                                  package("hpijs-ppds", {kX1}), package("printer-driver-filter", {}),
                                  package("printer-driver-broken", {{"", "", ""}})});
    EXPECT_EQ(catalogue.packages().size(), 0U);
}

const ListedDriver kThroughFilter{"Acme", "Acme X1 Foomatic/filter-x (recommended)", ""};

TEST(CatalogueBuilder, GivesTheDriversOfAFilterToThePackageThatBringsBoth) {
    const std::string collection = "foomatic-db-compressed-ppds";
    const auto catalogue =
        built({package(collection, {kThroughFilter, {"Acme", "Acme X2 Foomatic/filterless", ""}}),
               package("printer-driver-filter", {}, {"cups", collection})});
    EXPECT_EQ(packageFor(catalogue, "X1"), "printer-driver-filter");
    EXPECT_EQ(packageFor(catalogue, "X2"), collection);
    EXPECT_EQ(catalogue.candidatesFor("MFG:Acme;MDL:X1").size(), 1U);
}

TEST(CatalogueBuilder, OffersNoDriverWhoseFilterWouldNotComeAlong) {
    const std::string collection = "foomatic-db-compressed-ppds";
    EXPECT_EQ(packageFor(built({package(collection, {kThroughFilter}), package("printer-driver-filter", {})}),
                         "X1"),
              "");
    const ListedDriver throughSuperseded{"Acme", "Acme X3 Foomatic/hpijs-pcl3", ""};
    EXPECT_EQ(packageFor(built({package(collection, {throughSuperseded})}), "X3"), "");
    EXPECT_EQ(packageFor(built({package("printer-driver-filter", {kThroughFilter})}), "X1"),
              "printer-driver-filter");
}

TEST(CatalogueBuilder, ReplacesAPackageThatIsAddedAgain) {
    const ListedDriver kX2{"Acme", "Acme X2", ""};
    const auto catalogue =
        built({package("printer-driver-acme", {kX1}), package("printer-driver-acme", {kX2})});
    EXPECT_EQ(packageFor(catalogue, "X1"), "");
    EXPECT_EQ(packageFor(catalogue, "X2"), "printer-driver-acme");
}

TEST(CatalogueText, CanBeReadAgain) {
    const auto catalogue = built({package("printer-driver-acme", {kX1}),
                                  package("printer-driver-gutenprint", {{"A & B", "A & B <1>", ""}})});
    const auto text = catalogueText(catalogue);
    ASSERT_TRUE(text);
    const auto reading = DriverCatalogue::parse(*text);
    ASSERT_TRUE(reading.catalogue) << reading.fault;
    EXPECT_EQ(reading.catalogue->packages(), catalogue.packages());
    EXPECT_EQ(reading.catalogue->release(), "debian 12");
    EXPECT_EQ(catalogueText(*reading.catalogue), text);
    EXPECT_EQ(text->find("http"), std::string::npos) << *text;
}

TEST(CatalogueText, IsAbsentForWhatBreaksTheFormat) {
    EXPECT_EQ(catalogueText(built({package("Bad Name", {kX1})})), std::nullopt);
    EXPECT_EQ(catalogueText(DriverCatalogue("", {})), std::nullopt);
    EXPECT_EQ(catalogueText(DriverCatalogue("debian\n12", {})), std::nullopt);
}

}  // namespace
}  // namespace ventras
