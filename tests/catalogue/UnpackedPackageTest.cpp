#include "catalogue/UnpackedPackage.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "catalogue/ControlData.h"
#include "platform/Handles.h"
#include "platform/linux/BoundedProgram.h"
#include "tests/parts/TemporaryFolder.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

TEST(ControlData, HasTheFieldsOfItsFirstParagraph) {
    const auto fields = controlFields(
        "\nPackage: x\nDepends: a,\n b\nDescription: short \n long: text\nEmpty:\n\nPackage: second\n");
    const std::map<std::string, std::string, std::less<>> expected{
        {"Package", "x"}, {"Depends", "a,"}, {"Description", "short"}, {"Empty", ""}};
    EXPECT_EQ(fields, expected);
}

TEST(ControlData, NamesThePackagesOfARelation) {
    EXPECT_EQ(packageNames("python3:any, cups (>= 1.5), foomatic-db-compressed-ppds | foomatic-db,"),
              (std::vector<std::string>{"python3", "cups", "foomatic-db-compressed-ppds", "foomatic-db"}));
    EXPECT_EQ(packageNames(""), std::vector<std::string>{});
}

TEST(BoundedProgram, GivesTheOutputOfAProgramThatSucceeds) {
    EXPECT_EQ(outputOf({"printf", "%s|", "a b", "$(c)"}, {}, 20s), "a b|$(c)|");
    EXPECT_EQ(outputOf({"printenv", "VENTRAS_TEST"}, {{"VENTRAS_TEST", "x=y"}}, 20s), "x=y\n");
    EXPECT_EQ(outputOf({"cat"}, {}, 20s), "") << "there is no input to wait for";
}

TEST(BoundedProgram, GivesNothingOfOneThatFails) {
    EXPECT_EQ(outputOf({"false"}, {}, 20s), std::nullopt);
    EXPECT_EQ(outputOf({"/does/not/exist"}, {}, 20s), std::nullopt);
    EXPECT_EQ(outputOf({}, {}, 20s), std::nullopt);
    EXPECT_EQ(outputOf({"sh", "-c", "echo text; kill -9 $$"}, {}, 20s), std::nullopt);
}

TEST(BoundedProgram, EndsOneThatDoesNotEnd) {
    const auto started = std::chrono::steady_clock::now();
    EXPECT_EQ(outputOf({"sleep", "60"}, {}, 200ms), std::nullopt);
    EXPECT_EQ(outputOf({"sh", "-c", "exec >&-; sleep 60"}, {}, 200ms), std::nullopt);
    EXPECT_EQ(outputOf({"sh", "-c", "sleep 60 & echo text"}, {}, 200ms), std::nullopt);
    EXPECT_EQ(outputOf({"yes"}, {}, 20s), std::nullopt) << "more than anybody prints";
    EXPECT_LT(std::chrono::steady_clock::now() - started, 30s);
}

/// A package in a folder of its own.
class UnpackedPackage : public testing::Test {
protected:
    UnpackedPackage() {
        folder_.write(
            "DEBIAN/control",
            "Package: printer-driver-acme\nVersion: 2-1\nDepends: acme-ppds\nDescription: for Acme\n");
    }

    void addProgram(const std::string& name, const std::string& script) {
        const auto path = folder_.write("usr/lib/cups/driver/" + name, "#!/bin/sh\n" + script);
        ASSERT_EQ(chmod(path.c_str(), 0755), 0);
    }

    PackageContent read() {
        auto reading = readUnpackedPackage(folder_.path());
        EXPECT_EQ(reading.fault, "");
        return reading.package.value_or(PackageContent{});
    }

    TemporaryFolder folder_;
};

std::string ppd(const std::string& model) {
    return "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*FileVersion: \"1.0\"\n*LanguageVersion: English\n"
           "*LanguageEncoding: ISOLatin1\n*PCFileName: \"A.PPD\"\n*Manufacturer: \"Acme\"\n*Product: "
           "\"(X)\"\n"
           "*ModelName: \"Acme " +
           model + "\"\n*NickName: \"Acme " + model +
           ", 1.0\"\n"
           "*ShortNickName: \"Acme " +
           model + "\"\n*1284DeviceID: \"MFG:Acme;MDL:" + model + ";\"\n";
}

TEST_F(UnpackedPackage, TellsWhatTheControlDataSays) {
    const auto package = read();
    EXPECT_EQ(package.name, "printer-driver-acme");
    EXPECT_EQ(package.version, "2-1");
    EXPECT_EQ(package.title, "for Acme");
    EXPECT_EQ(package.brings, std::vector<std::string>{"acme-ppds"});
    EXPECT_EQ(package.drivers.size(), 0U);
}

TEST_F(UnpackedPackage, AsksItsDriverPrograms) {
    addProgram("one", R"([ "$1" = list ] && echo '"one:1" en "Acme" "Acme X1" "MFG:Acme;MDL:X1;"')");
    addProgram("two", R"(echo "DEBUG: $#"; echo '"two:1" en "Acme" "Acme X2" ""')");
    folder_.write("usr/lib/cups/driver/README", "no program");
    EXPECT_EQ(read().drivers,
              (std::vector<ListedDriver>{{"Acme", "Acme X1", "MFG:Acme;MDL:X1;"}, {"Acme", "Acme X2", ""}}));
}

TEST_F(UnpackedPackage, LetsDriverProgramsFindTheirParts) {
    folder_.write("usr/share/gutenprint/5.3/xml/printers.xml", "");
    folder_.write("usr/lib/x86_64-linux-gnu/libpart.so", "");
    addProgram("one", R"(cd "$STP_DATA_PATH" && ls "$LD_LIBRARY_PATH/libpart.so" >&2 && )"
                      R"(echo '"one:1" en "Acme" "Acme X1" ""')");
    EXPECT_EQ(read().drivers.size(), 1U);
}

TEST_F(UnpackedPackage, ReadsPPDsCompressedOrNot) {
    folder_.write("usr/share/ppd/acme/X1.ppd", ppd("X1"));
    const auto compressed = folder_.write("usr/share/cups/model/X2.ppd.gz", "");
    ASSERT_GT(cupsFilePuts(CupsFilePtr(cupsFileOpen(compressed.c_str(), "w9")).get(), ppd("X2").c_str()), 0);
    folder_.write("usr/share/ppd/acme/notes.txt", "no driver");
    EXPECT_EQ(read().drivers, (std::vector<ListedDriver>{{"Acme", "Acme X2, 1.0", "MFG:Acme;MDL:X2;"},
                                                         {"Acme", "Acme X1, 1.0", "MFG:Acme;MDL:X1;"}}));
}

TEST_F(UnpackedPackage, ExpandsDriverInformation) {
    folder_.write(
        "usr/share/cups/drv/acme.drv",
        "#include <font.defs>\n#include <media.defs>\nFont *\nManufacturer \"Acme\"\nVersion 1.0\n"
        "DriverType custom\nModelNumber 1\nMediaSize A4\nResolution k 8 0 0 0 \"600dpi/600 DPI\"\n"
        "{ ModelName \"X1\"\nPCFileName \"x1.ppd\"\nAttribute \"1284DeviceID\" \"\" \"MFG:Acme;MDL:X1;\" }\n"
        "{ ModelName \"X2\"\nPCFileName \"x2.ppd\" }\n");
    EXPECT_EQ(read().drivers, (std::vector<ListedDriver>{{"Acme", "Acme X1, 1.0", "MFG:Acme;MDL:X1;"},
                                                         {"Acme", "Acme X2, 1.0", ""}}));
}

TEST_F(UnpackedPackage, NamesTheFileThatDoesNotTellItsDrivers) {
    const auto faultOf = [&] { return readUnpackedPackage(folder_.path()).fault; };
    const auto broken = folder_.write("usr/share/ppd/broken.ppd", "no PPD");
    EXPECT_EQ(faultOf(), broken.string() + ": does not tell its drivers");
    const auto information = folder_.write("usr/share/cups/drv/broken.drv", "{");
    EXPECT_EQ(faultOf(), information.string() + ": does not tell its drivers");
    addProgram("broken", "exit 1");
    EXPECT_EQ(faultOf(), (folder_ / "usr/lib/cups/driver/broken").string() + ": does not tell its drivers");
}

TEST(UnpackedPackageFolder, NeedsControlData) {
    const TemporaryFolder folder;
    EXPECT_EQ(readUnpackedPackage(folder.path()).fault,
              folder.path().string() + ": no package is unpacked here, with DEBIAN/control");
    EXPECT_FALSE(readUnpackedPackage(folder / "absent").package);
}

}  // namespace
}  // namespace ventras
