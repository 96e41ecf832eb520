#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

#include "devices/USBPrinterObject.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/queues/QueueMaking.h"

namespace ventras {
namespace {

struct Driver {
    std::string name, makeAndModel, deviceID, product, type;
};

class UsbQueue : public QueueMaking {
protected:
    // The scheduler's answer to whatever it is asked: queues, and drivers with PPDs of this text.
    void answer(ipp_t* response) override {
        QueueMaking::answer(response);
        for (const auto& driver : catalogue_) {
            const auto add = [&](ipp_tag_t tag, const char* name, const std::string& value) {
                ippAddString(response, IPP_TAG_PRINTER, tag, name, nullptr, value.c_str());
            };
            add(IPP_TAG_NAME, "ppd-name", driver.name);
            add(IPP_TAG_TEXT, "ppd-make-and-model", driver.makeAndModel);
            add(IPP_TAG_TEXT, "ppd-device-id", driver.deviceID);
            add(IPP_TAG_TEXT, "ppd-product", driver.product);
            add(IPP_TAG_KEYWORD, "ppd-type", driver.type);
            ippAddSeparator(response);
        }
    }

    std::int32_t make(std::optional<std::string> deviceID) {
        printer_ = USBPrinterObject::usbPrinterObjectWithLocation(fake_.platform, drivers_, 0x14100000, 0,
                                                                  1008, 17, std::move(deviceID));
        return makeFor(*printer_);
    }

    // A driver whose PPD is a file of this computer, for a device that names it.
    void installDriver(const std::string& model, const std::string& type = "postscript") {
        const auto path = folder_.write(model + ".ppd", ppdText(model));
        catalogue_.push_back(
            {path.string(), "Acme " + model, "MFG:Acme;MDL:" + model + ";", "(" + model + ")", type});
    }

    static std::string ppdText(const std::string& model) {
        return "*PPD-Adobe: \"4.3\"\n*ModelName: \"" + model + "\"\n";
    }

    std::vector<Driver> catalogue_;
    std::shared_ptr<USBPrinterObject> printer_;
};

constexpr const char* kPcl = "MFG:Acme;MDL:Laser;CMD:PCL;SN:7;";
constexpr const char* kPostscript = "MFG:Acme;MDL:Laser;CMD:POSTSCRIPT;SN:7;";

TEST_F(UsbQueue, IsMadeWithTheDriverThatFits) {
    installDriver("Laser");
    EXPECT_EQ(make(kPcl), 0);
    EXPECT_EQ(printer_->queueID(), "Acme_Laser");
    ASSERT_EQ(printSystem_.creations.size(), 1U);
    EXPECT_EQ(printSystem_.creations[0].ppdText, ppdText("Laser"));
    auto attributes = printSystem_.creations[0].attributes;
    EXPECT_EQ(attributes.erase("com.quillon.print.PrinterInfo.PPD"), 1U);
    EXPECT_EQ(attributes, (PropertyDictionary{{"Printer URI", "usb://Acme/Laser?serial=7"},
                                              {"MANUFACTURER:", "Acme"},
                                              {"MODEL:", "Laser"},
                                              {"SERN:", "7"},
                                              {"USBAddressLocationID", "14100000"},
                                              {"Location", "Reading Room"}}));
    EXPECT_EQ(output_, "INFO:Determining printer's features...\nQueue ID:Acme_Laser\n");
}

TEST_F(UsbQueue, IsNotMadeTwice) {
    installDriver("Laser");
    existing_ = {{"office", "usb://Acme/Laser?serial=7"}};
    EXPECT_EQ(make(kPcl), 242);
    EXPECT_EQ(printer_->queueID(), "office");
    EXPECT_EQ(printSystem_.creations.size(), 0U);
}

TEST_F(UsbQueue, OfAPrinterWithoutDriverOrPostscriptIsNotAskedForAnything) {
    printSystem_.autoSelection.info.product = "Laser";
    installDriver("Other");
    for (const auto* deviceID : {kPcl, "MFG:Acme;MDL:Laser;", "MFG:Acme;MDL:Laser;CMD:;", ""}) {
        EXPECT_EQ(make(deviceID), 241) << deviceID;
        EXPECT_EQ(printSystem_.contextsMade, 0) << deviceID;
    }
}

TEST_F(UsbQueue, TakesTheDriverOfTheProductThatAPostscriptPrinterNames) {
    installDriver("Studio");
    printSystem_.autoSelection.info = {.product = "(Studio)", .isBinaryOK = true};
    EXPECT_EQ(make(kPostscript), 0);
    EXPECT_EQ(printSystem_.creations.at(0).ppdText, ppdText("Studio"));
    EXPECT_EQ(printSystem_.binaryOK, std::vector{true});
}

TEST_F(UsbQueue, SaysWhatTheChannelPasses) {
    installDriver("Laser");
    EXPECT_EQ(make(kPostscript), 0);
    EXPECT_EQ(make(kPcl), 0);
    EXPECT_EQ(printSystem_.binaryOK, (std::vector{false, true}));
}

TEST_F(UsbQueue, HasNoDriverWhenThePostscriptPrinterDoesNotHelp) {
    installDriver("Studio");
    EXPECT_EQ(make(kPostscript), 241);  // no product
    printSystem_.autoSelection.info.product = "(Stranger)";
    EXPECT_EQ(make(kPostscript), 241);
    printSystem_.autoSelection = {.ppdStatus = 69, .info = {.product = "(Studio)"}};
    EXPECT_EQ(make(kPostscript), 241);
    printSystem_.autoSelection = {.createStatus = 69, .info = {.product = "(Studio)"}};
    EXPECT_EQ(make(kPostscript), 241);
    EXPECT_EQ(printSystem_.creations.size(), 0U);
}

TEST_F(UsbQueue, NeverTakesAFaxDriver) {
    installDriver("Laser", "fax");
    EXPECT_EQ(make(kPcl), 241);
}

TEST_F(UsbQueue, IsMadeWithTheDriverAsItIsWhenOptionSelectionFails) {
    installDriver("Laser");
    printSystem_.autoSelection = {.optionsStatus = 69, .newPPDText = "half a PPD"};
    EXPECT_EQ(make(kPcl), 0);
    EXPECT_EQ(printSystem_.creations.at(0).ppdText, ppdText("Laser"));
}

TEST_F(UsbQueue, IsMadeWithTheOptionsThatWereSelected) {
    installDriver("Laser");
    printSystem_.autoSelection.newPPDText = "a new PPD";
    EXPECT_EQ(make(kPcl), 0);
    EXPECT_EQ(printSystem_.creations.at(0).ppdText, "a new PPD");
}

TEST_F(UsbQueue, NeedsTheDriversPPD) {
    installDriver("Laser");
    std::filesystem::remove(catalogue_.at(0).name);
    EXPECT_EQ(make(kPcl), 241);
}

TEST_F(UsbQueue, HandsUpTheStatusOfCreation) {
    installDriver("Laser");
    printSystem_.create = [](const auto&) { return 73; };
    EXPECT_EQ(make(kPcl), 73);
    EXPECT_EQ(printer_->queueID(), std::nullopt);
}

}  // namespace
}  // namespace ventras
