#include "catalogue/DriverCatalogue.h"

#include <gtest/gtest.h>

#include <random>

#include "catalogue/CatalogueFormat.h"
#include "tests/catalogue/CatalogueTexts.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using Names = std::vector<std::string>;

Names namesOf(const DriverCatalogue::Packages& packages) {
    Names names;
    for (const auto* package : packages)
        names.push_back(package->name);
    return names;
}

DriverCatalogue parsed(const std::string& text) {
    auto reading = DriverCatalogue::parse(text);
    EXPECT_EQ(reading.fault, "") << text;
    return std::move(reading.catalogue).value();
}

TEST(DriverCatalogue, TellsReleaseAndPackagesBestTierFirst) {
    const auto catalogue = parsed(smallCatalogue("debian 13"));
    EXPECT_EQ(catalogue.release(), "debian 13");
    ASSERT_EQ(catalogue.packages().size(), 4U);
    EXPECT_EQ(
        catalogue.packages().back(),
        (DriverPackage{.name = "collection",
                       .title = "A driver",
                       .version = "1.0-1",
                       .tier = 2,
                       .tags = {"MANUFACTURER:HP;MODEL:LaserJet 4", "MANUFACTURER:HP;MODEL:LaserJet 5"}}));
}

TEST(DriverCatalogue, FindsTheBestPackagesForADevice) {
    struct Case {
        std::string deviceID;
        Names best, all;
    };
    const Case cases[] = {
        {"MANUFACTURER:HP;MODEL:LaserJet 4", {"laser-driver"}, {"laser-driver", "collection"}},
        {"MANUFACTURER:hewlett-packard;MODEL:HP  LASERJET 4",
         {"laser-driver"},
         {"laser-driver", "collection"}},
        {"MANUFACTURER:HP;MODEL:LaserJet 5", {"collection"}, {"collection"}},
        {"MANUFACTURER:HP;MODEL:LaserJet 6",
         {"laser-driver", "other-laser-driver"},
         {"laser-driver", "other-laser-driver"}},
        {"MFG:Epson;MDL:Stylus C80;CMD:ESCPL2;", {"ink-driver"}, {"ink-driver"}},
        {"MANUFACTURER:HP;MODEL:LaserJet", {}, {}},
        {"MANUFACTURER:HP;MODEL:LaserJet 4L", {}, {}},
        {"printing software", {}, {}},
        {"printer update", {}, {}},
        {"", {}, {}},
        {std::string(10'000, '"'), {}, {}},
    };
    const auto catalogue = parsed(smallCatalogue());
    for (const auto& [deviceID, best, all] : cases) {
        EXPECT_EQ(namesOf(catalogue.packagesFor(deviceID)), best) << deviceID;
        EXPECT_EQ(namesOf(catalogue.candidatesFor(deviceID)), all) << deviceID;
    }
}

TEST(DriverCatalogue, CountsDriverlessPackagesOnlyWhenTheyAreAskedFor) {
    const std::vector<std::string> tags{"MANUFACTURER:HP;MODEL:LaserJet 4"};
    auto driverless = packageEntry(0, tags);
    driverless.emplace("driverless", true);
    const auto catalogue =
        parsed(textOf(catalogueContent({{"driverless", driverless}, {"plain", packageEntry(1, tags)}})));
    EXPECT_EQ(namesOf(catalogue.packagesFor(tags.front())), Names{"plain"});
    EXPECT_EQ(namesOf(catalogue.packagesFor(tags.front(), PackageScope::AlsoDriverless)),
              Names{"driverless"});
}

TEST(DriverCatalogue, ReportsDevicesWithSeveralBestPackages) {
    const auto catalogue = parsed(smallCatalogue());
    std::string report;
    catalogue.forEachConflict([&](const std::string& key, const DriverCatalogue::Packages& packages) {
        report += key + testing::PrintToString(namesOf(packages));
    });
    EXPECT_EQ(report, R"(hp;laserjet 6{ "laser-driver", "other-laser-driver" })");
    EXPECT_EQ(catalogue.coverage().devices, 4U);
    EXPECT_EQ(catalogue.coverage().resolved, 3U);
}

/// The fault in a catalogue of one package "pkg" in which one member was replaced; a null value takes it out.
std::string faultWith(std::string_view key, std::optional<PropertyValue> value) {
    auto entry = packageEntry(0, {"MANUFACTURER:HP;MODEL:LaserJet 4"});
    entry.erase(std::string(key));
    if (value)
        entry.emplace(key, *std::move(value));
    const auto reading = DriverCatalogue::parse(textOf(catalogueContent({{"pkg", entry}})));
    EXPECT_FALSE(reading.catalogue) << key;
    return reading.fault;
}

TEST(CatalogueReader, NamesTheEntryThatIsWrong) {
    EXPECT_EQ(faultWith("title", {}), "pkg: no \"title\"");
    EXPECT_EQ(faultWith("title", ""), "pkg: \"title\" is empty, too long, or no plain text");
    EXPECT_EQ(faultWith("title", std::string(257, 'x')),
              "pkg: \"title\" is empty, too long, or no plain text");
    EXPECT_EQ(faultWith("title", "two\nlines"), "pkg: \"title\" is empty, too long, or no plain text");
    EXPECT_EQ(faultWith("title", true), "pkg: \"title\" is of the wrong type");
    EXPECT_EQ(faultWith("version", {}), "pkg: no \"version\"");
    EXPECT_EQ(faultWith("version", "\tx"), "pkg: \"version\" is empty, too long, or no plain text");
    EXPECT_EQ(faultWith("tier", {}), "pkg: no \"tier\"");
    EXPECT_EQ(faultWith("tier", "0"), "pkg: \"tier\" is of the wrong type");
    EXPECT_EQ(faultWith("tier", std::int64_t{-1}), "pkg: \"tier\" is not within 0 and 9");
    EXPECT_EQ(faultWith("tier", std::int64_t{10}), "pkg: \"tier\" is not within 0 and 9");
    EXPECT_EQ(faultWith("driverless", "yes"), "pkg: \"driverless\" is of the wrong type");
    EXPECT_EQ(faultWith("tags", {}), "pkg: no \"tags\"");
    EXPECT_EQ(faultWith("tags", "MANUFACTURER:HP;MODEL:1"), "pkg: \"tags\" is of the wrong type");
}

TEST(CatalogueReader, NamesTheTagThatIsWrong) {
    const std::string good = "MANUFACTURER:HP;MODEL:LaserJet 4";
    const std::string second = "pkg: tag 2 is empty, too long, or no plain text";
    EXPECT_EQ(faultWith("tags", PropertyArray{good, ""}), second);
    EXPECT_EQ(faultWith("tags", PropertyArray{good, std::int64_t{4}}), second);
    EXPECT_EQ(faultWith("tags", PropertyArray{good, good + "\n"}), second);
    EXPECT_EQ(faultWith("tags", PropertyArray{good, good + "\u009b"}), second);
    EXPECT_EQ(faultWith("tags", PropertyArray{good, std::string(1000, 'x')}), second);
    EXPECT_EQ(faultWith("tags", PropertyArray{good, "MANUFACTURER:hp;MODEL:HP LASERJET 4"}),
              "pkg: the tag \"MANUFACTURER:hp;MODEL:HP LASERJET 4\" is there twice");
    EXPECT_EQ(faultWith("tags", PropertyArray{"other", "other"}), "pkg: the tag \"other\" is there twice");
}

TEST(CatalogueReader, RefusesAbsurdNumbersOfThings) {
    PropertyArray tags;
    for (std::size_t i = 0; i <= CatalogueFormat::kMostTags; ++i)
        tags.emplace_back(std::to_string(i));
    EXPECT_EQ(faultWith("tags", tags), "pkg: too many tags");
    PropertyDictionary packages;
    for (std::size_t i = 0; i <= CatalogueFormat::kMostPackages; ++i)
        packages.emplace("pkg" + std::to_string(i), packageEntry(0, {}));
    EXPECT_EQ(DriverCatalogue::parse(textOf(catalogueContent(packages))).fault,
              "the file: too many packages");
    EXPECT_EQ(DriverCatalogue::parse(std::string(CatalogueFormat::kLongestFile + 1, ' ')).fault,
              "it is too long");
}

TEST(CatalogueReader, RefusesNamesThatNoPackageCanHave) {
    for (const std::string name : {"x", "", "Name", "-option", "--force", "a b", "../x", "/etc/x", "a;b", "ä",
                                   "a_b", "a\"b", "a\nb"}) {
        const auto reading = DriverCatalogue::parse(textOf(catalogueContent({{name, packageEntry(0, {})}})));
        EXPECT_FALSE(reading.catalogue) << name;
        EXPECT_EQ(reading.fault, "the file: a package has a name that no package can have") << name;
    }
    const auto reading =
        DriverCatalogue::parse(textOf(catalogueContent({{"lib-x2.0+b", packageEntry(0, {})}})));
    EXPECT_TRUE(reading.catalogue) << reading.fault;
}

TEST(CatalogueReader, RefusesFilesOfAnotherKind) {
    auto noFormat = catalogueContent({});
    noFormat.erase("format");
    auto otherFormat = catalogueContent({});
    otherFormat.insert_or_assign("format", std::int64_t{2});
    auto noRelease = catalogueContent({});
    noRelease.erase("release");
    auto noPackages = catalogueContent({});
    noPackages.insert_or_assign("packages", PropertyArray{});
    const std::pair<std::string, std::string> cases[] = {
        {textOf(noFormat), "the file: no \"format\""},
        {textOf(otherFormat), "the file: its format is not 1"},
        {textOf(noRelease), "the file: no \"release\""},
        {textOf(noPackages), "the file: \"packages\" is of the wrong type"},
        {textOf(catalogueContent({{"pkg", "text"}})), "the file: pkg is no dictionary"},
        {"", "it is no whole XML property list with a dictionary"},
        {"{\"format\": 1}", "it is no whole XML property list with a dictionary"},
        {"<plist><array/></plist>", "it is no whole XML property list with a dictionary"},
    };
    for (const auto& [text, fault] : cases) {
        const auto reading = DriverCatalogue::parse(text);
        EXPECT_FALSE(reading.catalogue) << text;
        EXPECT_EQ(reading.fault, fault) << text;
    }
}

TEST(CatalogueReader, RefusesATruncatedFileWhereverItEnds) {
    auto text = smallCatalogue();
    text.resize(text.find_last_not_of('\n') + 1);
    ASSERT_TRUE(DriverCatalogue::parse(text).catalogue);
    for (std::size_t size = 0; size < text.size(); ++size)
        EXPECT_FALSE(DriverCatalogue::parse(text.substr(0, size)).catalogue) << size;
}

TEST(CatalogueReader, SurvivesAnyDamage) {
    const auto good = smallCatalogue();
    std::mt19937 random(3);
    for (int round = 0; round < 2000; ++round) {
        auto damaged = good;
        for (unsigned i = 0; i <= random() % 6; ++i)
            damaged[random() % damaged.size()] = static_cast<char>(random());
        const auto reading = DriverCatalogue::parse(damaged);
        EXPECT_NE(reading.catalogue.has_value(), !reading.fault.empty()) << damaged;
        if (reading.catalogue) {
            for (const auto& package : reading.catalogue->packages())
                EXPECT_TRUE(CatalogueFormat::isPackageName(package.name)) << damaged;
        }
    }
}

TEST(CatalogueReader, NamesTheFileThatItCannotRead) {
    const TemporaryFolder folder;
    EXPECT_EQ(DriverCatalogue::read(folder / "absent").fault,
              (folder / "absent").string() + ": there is no such file");
    EXPECT_EQ(DriverCatalogue::read(folder.path()).fault, folder.path().string() + ": there is no such file");
    EXPECT_EQ(DriverCatalogue::read("/dev/zero").fault, "/dev/zero: there is no such file");
    const auto file = folder.write("broken", "<plist>");
    EXPECT_EQ(DriverCatalogue::read(file).fault,
              file.string() + ": it is no whole XML property list with a dictionary");
    const auto tooLong = folder.write("long", std::string(CatalogueFormat::kLongestFile + 1, ' '));
    EXPECT_EQ(DriverCatalogue::read(tooLong).fault, tooLong.string() + ": it is too long");
    const auto good = folder.write("good", smallCatalogue());
    EXPECT_EQ(DriverCatalogue::read(good).fault, "");
}

}  // namespace
}  // namespace ventras
