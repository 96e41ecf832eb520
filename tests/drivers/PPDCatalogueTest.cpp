#include "drivers/PPDCatalogue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <thread>

#include "drivers/PPDManager.h"
#include "tests/drivers/PPDText.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;
using Text = std::optional<std::string>;
using Texts = std::vector<std::string>;

/// An answer to CUPS-Get-PPDs, put together attribute by attribute.
class Answer {
public:
    Answer& driver() {
        ippAddSeparator(message_.get());
        return *this;
    }

    Answer& text(const char* name, const Texts& values, ipp_tag_t tag = IPP_TAG_TEXT,
                 ipp_tag_t group = IPP_TAG_PRINTER) {
        std::vector<const char*> pointers;
        for (const auto& value : values)
            pointers.push_back(value.c_str());
        ippAddStrings(message_.get(), group, tag, name, static_cast<int>(pointers.size()), nullptr,
                      pointers.data());
        return *this;
    }

    Answer& number(const char* name, int value) {
        ippAddInteger(message_.get(), IPP_TAG_PRINTER, IPP_TAG_INTEGER, name, value);
        return *this;
    }

    std::vector<PPDRecord> records() const { return PPDCatalogue::recordsIn(message_.get()); }

private:
    IppPtr message_{ippNewResponse(IppPtr{ippNewRequest(IPP_OP_CUPS_GET_PPDS)}.get())};
};

TEST(CatalogueRecord, HasTheNineAttributesThatItKnows) {
    const auto records = Answer()
                             .text("ppd-name", {"drv:///a"}, IPP_TAG_NAME)
                             .text("ppd-natural-language", {"en", "de"}, IPP_TAG_LANGUAGE)
                             .text("ppd-make", {"Acme"})
                             .text("ppd-make-and-model", {"Acme Jet"})
                             .text("ppd-device-id", {"MFG:Acme;"})
                             .text("ppd-product", {"(Jet)", "Jet"})
                             .text("ppd-psversion", {"(3010) 0"})
                             .text("ppd-type", {"raster"}, IPP_TAG_KEYWORD)
                             .number("ppd-model-number", 17)
                             .text("ppd-other", {"x"})
                             .records();
    PPDRecord expected;
    expected.name = "drv:///a";
    expected.naturalLanguage = Texts{"en", "de"};
    expected.make = "Acme";
    expected.makeAndModel = "Acme Jet";
    expected.deviceID = "MFG:Acme;";
    expected.product = {"(Jet)", "Jet"};
    expected.psVersion = {"(3010) 0"};
    expected.type = "raster";
    expected.modelNumber = "17";
    EXPECT_THAT(records, ElementsAre(expected));
}

TEST(CatalogueRecord, HasEachValueOnceAndNoneOfGhostscript) {
    const auto records =
        Answer()
            .text("ppd-product", {"(Jet)", "(GNU Ghostscript)", "(Jet)", "(jet)", "ghostscript"})
            .text("ppd-psversion", {"(Ghostscript 10) 0", "(3010) 0", "(3010) 0"})
            .text("ppd-natural-language", {"en", "en", "Ghostscript"})
            .records();
    ASSERT_THAT(records, SizeIs(1));
    EXPECT_THAT(records[0].product, ElementsAre("(Jet)", "(jet)", "ghostscript"));
    EXPECT_THAT(records[0].psVersion, ElementsAre("(3010) 0"));
    EXPECT_EQ(records[0].naturalLanguage, Texts{"en"});
}

TEST(CatalogueRecord, TakesTheFirstOfSeveralValuesOfASingleText) {
    const auto records =
        Answer().text("ppd-make", {"A", "B"}).text("ppd-name", {"n", "m"}, IPP_TAG_NAME).records();
    ASSERT_THAT(records, SizeIs(1));
    EXPECT_EQ(records[0].make, "A");
    EXPECT_EQ(records[0].name, "n");
}

TEST(CatalogueRecord, IsOneRunOfPrinterAttributes) {
    const auto records = Answer()
                             .text("ppd-make", {"not a printer's"}, IPP_TAG_TEXT, IPP_TAG_OPERATION)
                             .driver()
                             .text("ppd-name", {"a"}, IPP_TAG_NAME)
                             .text("ppd-make", {"A"})
                             .driver()
                             .text("ppd-other", {"x"})
                             .driver()
                             .driver()
                             .text("ppd-name", {"b"}, IPP_TAG_NAME)
                             .text("ppd-make", {"not a printer's"}, IPP_TAG_TEXT, IPP_TAG_JOB)
                             .text("ppd-name", {"c"}, IPP_TAG_NAME)
                             .records();
    ASSERT_THAT(records, SizeIs(3));
    EXPECT_EQ(records[0].name, "a");
    EXPECT_EQ(records[0].make, "A");
    EXPECT_EQ(records[1].name, "b");
    EXPECT_EQ(records[1].make, std::nullopt);
    EXPECT_EQ(records[2].name, "c");
}

TEST(CatalogueRecord, OfTheSchedulersDriverlessDriverIsLeftOut) {
    const auto records = Answer()
                             .text("ppd-name", {"drv:///vellum.drv/urf.ppd"}, IPP_TAG_NAME)
                             .driver()
                             .text("ppd-name", {"drv:///VELLUM.drv/urf.ppd"}, IPP_TAG_NAME)
                             .driver()
                             .text("ppd-name", {"drv:///vellum.drv/urf.ppd.gz"}, IPP_TAG_NAME)
                             .driver()
                             .text("ppd-make", {"nameless"})
                             .records();
    ASSERT_THAT(records, SizeIs(3));
    EXPECT_EQ(records[0].name, "drv:///VELLUM.drv/urf.ppd");
    EXPECT_EQ(records[1].name, "drv:///vellum.drv/urf.ppd.gz");
    EXPECT_EQ(records[2].make, "nameless");
}

TEST(CatalogueRecord, PassesOverValuesOfAnotherKind) {
    const auto records = Answer()
                             .number("ppd-name", 5)
                             .number("ppd-product", 5)
                             .text("ppd-model-number", {"5"})
                             .text("ppd-make", {"A"})
                             .records();
    ASSERT_THAT(records, SizeIs(1));
    PPDRecord expected;
    expected.make = "A";
    EXPECT_EQ(records[0], expected);
    EXPECT_THAT(Answer().number("ppd-name", 5).records(), IsEmpty());
}

TEST(CatalogueRecord, HasAModelNumberBelowZeroInDecimal) {
    EXPECT_EQ(Answer().number("ppd-model-number", -5).records().at(0).modelNumber, "-5");
}

TEST(CatalogueRecord, IsMissingFromAnEmptyAnswer) {
    EXPECT_THAT(Answer().records(), IsEmpty());
    EXPECT_THAT(PPDCatalogue::recordsIn(nullptr), IsEmpty());
}

std::string jetPPD() {
    return ppdText({"*FileVersion: \"1.0\"", "*LanguageVersion: English", "*Manufacturer: \"Acme\"",
                    "*ModelName: \"Acme Jet\"", "*NickName: \"Acme Jet Driver\"", "*Product: \"(Jet 5/5M)\"",
                    "*1284DeviceID: \"MFG:Acme;MDL:Jet 5;\"", "*PSVersion: \"(3010) 0\""});
}

class Catalogue : public testing::Test {
protected:
    const PPDRecord* find(const PPDManager::Records& records, std::string_view makeAndModel) const {
        const auto found = std::ranges::find(records, Text(makeAndModel), &PPDRecord::makeAndModel);
        return found == records.end() ? nullptr : &*found;
    }

    FakePlatform fakes_;
    PPDManager manager_{fakes_.platform};
};

TEST_F(Catalogue, OfARealSchedulerHasItsDrivers) {
    const PrivateScheduler scheduler({.models = {{{"jet.ppd", jetPPD()}}}});
    const UseScheduler use(scheduler);
    const auto records = manager_.ppds();
    const auto* jet = find(records, "Acme Jet Driver");
    ASSERT_NE(jet, nullptr) << scheduler.errorLog();
    EXPECT_EQ(jet->name, "jet.ppd");
    EXPECT_EQ(jet->make, "Acme");
    EXPECT_EQ(jet->deviceID, "MFG:Acme;MDL:Jet 5;");
    EXPECT_EQ(jet->modelNumber, "0");
    // The scheduler takes the parentheses off and adds the model.
    EXPECT_THAT(jet->product, ElementsAre("Jet 5/5M", "Acme Jet"));
    EXPECT_EQ(jet->naturalLanguage, Texts{"en"});
    EXPECT_EQ(PPDManager::ppdKind(*jet), 7U);
}

TEST_F(Catalogue, IsWhatMatchingWithoutAListLooksThrough) {
    const PrivateScheduler scheduler({.models = {{{"jet.ppd", jetPPD()}}}});
    const UseScheduler use(scheduler);
    const auto named = [](const PPDManager::Records& records) {
        Texts names;
        for (const auto& record : records)
            names.push_back(record.name.value_or(""));
        return names;
    };
    EXPECT_THAT(named(manager_.matchPPDsByDeviceID("MFG:Acme;MDL:jet 5;", std::nullopt, std::nullopt)),
                ElementsAre("jet.ppd"));
    EXPECT_THAT(named(manager_.matchPPDsByProduct("(jet 5 5m)")), ElementsAre("jet.ppd"));
    EXPECT_THAT(named(manager_.matchPPDsByModel("Acme Jet DRIVER")), ElementsAre("jet.ppd"));
    EXPECT_THAT(manager_.matchPPDsByModel("Jet"), IsEmpty());
}

TEST_F(Catalogue, IsAskedForAnewEachTime) {
    const PrivateScheduler scheduler({.models = {{{"jet.ppd", jetPPD()}}}});
    const UseScheduler use(scheduler);
    EXPECT_EQ(find(manager_.ppds(), "Acme Ink"), nullptr);
    std::string ink = jetPPD();
    ink.replace(ink.find("Acme Jet Driver"), 15, "Acme Ink");
    std::ofstream(scheduler.folder() / "data/model/ink.ppd") << ink;
    EXPECT_NE(find(manager_.ppds(), "Acme Ink"), nullptr);
}

TEST_F(Catalogue, OfTheSystemHasTheSampleDriversThatTheGenericOnesAre) {
    const PrivateScheduler scheduler;
    const UseScheduler use(scheduler);
    EXPECT_EQ(manager_.genericPCLPPD().name, "drv:///sample.drv/generpcl.ppd");
    EXPECT_EQ(manager_.genericPostscriptPPD().name, "drv:///sample.drv/generic.ppd");
    EXPECT_EQ(manager_.genericPostscriptPPD().product, Texts{"PostScript Printer"});
}

TEST_F(Catalogue, IsEmptyWithoutAScheduler) {
    const UseScheduler nowhere("/nonexistent.sock");
    EXPECT_THAT(manager_.ppds(), IsEmpty());
    EXPECT_THAT(manager_.matchPPDsByModel("Jet"), IsEmpty());
    EXPECT_EQ(manager_.genericPCLPPD(), PPDRecord{});
    EXPECT_EQ(manager_.genericPostscriptPPD().name, fakes_.resources.folder / "Generic.ppd");
}

TEST_F(Catalogue, IsCompleteForManyThreadsAtOnce) {
    const PrivateScheduler scheduler({.models = {{{"jet.ppd", jetPPD()}}}});
    const UseScheduler use(scheduler);
    std::vector<std::jthread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back([&] { EXPECT_NE(find(manager_.ppds(), "Acme Jet Driver"), nullptr); });
}

}  // namespace
}  // namespace ventras
