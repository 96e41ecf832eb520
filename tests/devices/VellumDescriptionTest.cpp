#include <gtest/gtest.h>

#include <chrono>
#include <string>
#include <vector>

#include "devices/VellumProfilePrinterObject.h"
#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/Loopback.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const DeviceDescription kScripted{
    {"pdl", "application/octet-stream,application/pdf,image/urf"},
    {"display-name", "Scripted"},
    {"note", "Lab 3"},
    {"product", "(Acme Scripted)"},
    {"UUID", "12345678-9abc-def0-1234-56789abcdef0"},
    {"URF", "V1.4,CP1,W8,SRGB24,RS600,DM3"},
    {"Duplex", "T"},
};

// A device object that asks a real printer.
class VellumDescription : public testing::Test {
protected:
    VellumProfilePrinterObject printerAt(const std::string& uri) { return {fake_.platform, drivers_, uri}; }

    DeviceDescription descriptionWith(AttributeEdit edit) {
        const ScriptedPrinter scripted({.edit = std::move(edit)});
        return printerAt(scripted.uri()).attributes();
    }

    FakePlatform fake_;
    PPDManager drivers_{fake_.platform};
};

TEST_F(VellumDescription, HoldsWhatThePrinterTellsAboutItself) {
    const ScriptedPrinter scripted;
    auto printer = printerAt(scripted.uri());
    EXPECT_EQ(printer.attributes(), kScripted);
    EXPECT_EQ(fake_.log.lines(), std::vector<std::string>{});
    EXPECT_EQ(printer.difficulty(), std::nullopt);
}

TEST_F(VellumDescription, IsAskedForWithOneRequestForNineAttributes) {
    const ScriptedPrinter scripted;
    auto printer = printerAt(scripted.uri());
    printer.attributes();
    printer.name();
    printer.attributes();

    const auto requests = scripted.requests();
    ASSERT_EQ(requests.size(), 1U);
    EXPECT_EQ(requests[0].operation, IPP_OP_GET_PRINTER_ATTRIBUTES);
    EXPECT_EQ(requests[0].printerUri, scripted.uri());
    EXPECT_EQ(requests[0].requestedAttributes,
              (std::vector<std::string>{"document-format-supported", "output-mode-supported",
                                        "print-color-mode-supported", "printer-dns-sd-name",
                                        "printer-location", "printer-make-and-model", "printer-uuid",
                                        "sides-supported", "urf-supported"}));
}

TEST_F(VellumDescription, IsNotAskedForBeforeItIsNeeded) {
    const ScriptedPrinter scripted;
    auto printer = printerAt(scripted.uri());
    EXPECT_EQ(printer.deviceURI(), scripted.uri());
    EXPECT_EQ(printer.driverList()->size(), 1U);
    EXPECT_EQ(printer.matchExistingQueues({}), std::nullopt);
    EXPECT_EQ(scripted.connectionCount(), 0U);
}

TEST_F(VellumDescription, ComesFromTheResourceThatTheURINames) {
    const ScriptedPrinter scripted({.services = {{"/ipp/fax%20out", [](ipp_t* answer) {
                                                      setAttribute(answer, IPP_TAG_NAME,
                                                                   "printer-dns-sd-name", "Fax");
                                                  }}}});
    auto uri = scripted.uri();
    uri.replace(uri.find("/ipp/print"), std::string::npos, "/ipp/fax%20out");
    EXPECT_EQ(printerAt(uri).name(), "Fax");
    ASSERT_EQ(scripted.requests().size(), 1U);
    EXPECT_EQ(scripted.requests()[0].printerUri, uri);
}

TEST_F(VellumDescription, IsAskedForOverIPv6) {
    const ScriptedPrinter scripted({.listensOnIPv4 = false, .listensOnIPv6 = true});
    EXPECT_EQ(printerAt(scripted.uri()).attributes(), kScripted);
}

struct AttributeCase {
    const char* name;
    std::string key;
    ipp_tag_t otherTag;
};

const AttributeCase kAttributes[] = {
    {"document-format-supported", "pdl", IPP_TAG_KEYWORD},
    {"printer-dns-sd-name", "display-name", IPP_TAG_TEXT},
    {"printer-location", "note", IPP_TAG_NAME},
    {"printer-make-and-model", "product", IPP_TAG_NAME},
    {"printer-uuid", "UUID", IPP_TAG_TEXT},
    {"urf-supported", "URF", IPP_TAG_TEXT},
    {"sides-supported", "Duplex", IPP_TAG_NAME},
};

DeviceDescription scriptedWithout(const std::string& key) {
    auto description = kScripted;
    description.erase(key);
    return description;
}

TEST_F(VellumDescription, LeavesOutWhatThePrinterDoesNotTell) {
    for (const auto& attribute : kAttributes)
        EXPECT_EQ(descriptionWith([&](ipp_t* answer) { removeAttribute(answer, attribute.name); }),
                  scriptedWithout(attribute.key))
            << attribute.name;
}

TEST_F(VellumDescription, LeavesOutWhatThePrinterTellsWithAnotherTag) {
    for (const auto& attribute : kAttributes)
        EXPECT_EQ(descriptionWith([&](ipp_t* answer) {
                      setAttribute(answer, attribute.otherTag, attribute.name, "value");
                  }),
                  scriptedWithout(attribute.key))
            << attribute.name;
}

TEST_F(VellumDescription, TakesNamesAndTextsThatComeWithTheirLanguage) {
    const auto description = descriptionWith([](ipp_t* answer) {
        removeAttribute(answer, "printer-dns-sd-name");
        ippAddString(answer, IPP_TAG_PRINTER, IPP_TAG_NAMELANG, "printer-dns-sd-name", "de", "Büro");
    });
    EXPECT_EQ(description.at("display-name"), "Büro");
}

TEST_F(VellumDescription, TellsDuplexByTheLongEdge) {
    const std::vector<std::pair<std::vector<const char*>, std::string>> cases{
        {{"one-sided", "two-sided-long-edge"}, "T"},
        {{"two-sided-long-edge"}, "T"},
        {{"one-sided"}, "F"},
        {{"one-sided", "two-sided-short-edge"}, "F"},
    };
    for (const auto& [sides, expected] : cases) {
        const auto description = descriptionWith([&sides = sides](ipp_t* answer) {
            removeAttribute(answer, "sides-supported");
            ippAddStrings(answer, IPP_TAG_PRINTER, IPP_TAG_KEYWORD, "sides-supported",
                          static_cast<int>(sides.size()), nullptr, sides.data());
        });
        EXPECT_EQ(description.at("Duplex"), expected) << sides.back();
    }
}

TEST_F(VellumDescription, TakesNoTextThatIsNotUtf8) {
    const ScriptedPrinter scripted({.rawAttributes = {{IPP_TAG_NAME, "printer-dns-sd-name", "B\xfcro"}}});
    auto printer = printerAt(scripted.uri());
    EXPECT_EQ(printer.attributes(), scriptedWithout("display-name"));
    EXPECT_EQ(printer.name(), "Acme Scripted");
}

TEST_F(VellumDescription, TakesTheAttributesOfAnAnswerWhoseStatusIsAnError) {
    const auto description =
        descriptionWith([](ipp_t* answer) { ippSetStatusCode(answer, IPP_STATUS_ERROR_BUSY); });
    EXPECT_EQ(description, kScripted);
}

using NamedFault = std::pair<Fault, std::string_view>;

// Those that are over as soon as the printer has answered; what it holds back is for the deadline of a
// request.
std::vector<NamedFault> promptFaults() {
    auto faults = allFaults();
    std::erase_if(faults, [](const NamedFault& named) {
        switch (named.first) {
            case Fault::silent:
            case Fault::drip:
            case Fault::garbageThenSilence:
            case Fault::halfThenSilence:
                return true;
            default:
                return named.first == Fault::none || named.first == Fault::wrongRequestId;
        }
    });
    return faults;
}

class VellumFault : public VellumDescription, public testing::WithParamInterface<NamedFault> {};

TEST_P(VellumFault, LeavesAnEmptyDescriptionThatIsAskedForOnce) {
    const ScriptedPrinter scripted({.fault = GetParam().first});
    auto printer = printerAt(scripted.uri());
    EXPECT_EQ(printer.attributes(), DeviceDescription{});
    const auto connections = scripted.connectionCount();
    EXPECT_EQ(printer.name(), std::nullopt);
    EXPECT_EQ(scripted.connectionCount(), connections);
    EXPECT_NE(printer.difficulty(), std::nullopt);
    EXPECT_EQ(fake_.log.lines(), std::vector<std::string>{});
}

INSTANTIATE_TEST_SUITE_P(Printer, VellumFault, testing::ValuesIn(promptFaults()),
                         [](const auto& test) { return std::string(test.param.second); });

TEST_F(VellumDescription, IsEmptyWithOneLogLineWhenThePrinterCannotBeReached) {
    const auto port = std::to_string(freePort());
    auto printer = printerAt("ipp://127.0.0.1:" + port + "/ipp/print");
    EXPECT_EQ(printer.attributes(), DeviceDescription{});
    EXPECT_EQ(printer.attributes(), DeviceDescription{});
    EXPECT_EQ(printer.name(), std::nullopt);
    ASSERT_EQ(fake_.log.lines().size(), 1U);
    const auto line = fake_.log.lines().front();
    const auto expected =
        "-[VellumProfilePrinterObject updateAttributes]: Unable to connect to 127.0.0.1:" + port + ": ";
    EXPECT_TRUE(line.starts_with(expected) && line.size() > expected.size()) << line;
    EXPECT_NE(printer.difficulty().value_or("").find("cannot be reached"), std::string::npos);
}

TEST_F(VellumDescription, IsEmptyForURIsThatNameNoHost) {
    for (const std::string_view uri :
         {"ipp://", "ipps://", "ipp:///ipp/print", "ipp://[", "ipp://[::1", "ipp://:631/", "ipp://%zz/",
          "ipp://host.invalid:99999/", "ipp:// /", ""}) {
        auto printer = printerAt(std::string(uri));
        EXPECT_EQ(printer.attributes(), DeviceDescription{}) << uri;
    }
}

TEST_F(VellumDescription, IsAskedForAnewOnDemand) {
    const ScriptedPrinter scripted;
    auto printer = printerAt(scripted.uri());
    printer.setAttributes({{"note", "old"}});
    EXPECT_EQ(printer.attributes(), (DeviceDescription{{"note", "old"}}));
    EXPECT_EQ(scripted.requests().size(), 0U);
    printer.updateAttributes();
    EXPECT_EQ(printer.attributes(), kScripted);
}

TEST_F(VellumDescription, ForgetsAnEarlierFailureWhenThePrinterAnswersAtLast) {
    const ScriptedPrinter scripted({.fault = Fault::notFound});
    auto printer = printerAt(scripted.uri());
    printer.updateAttributes();
    ASSERT_NE(printer.difficulty(), std::nullopt);
    printer.setAttributes(kScripted);
    EXPECT_EQ(printer.difficulty(), std::nullopt);
}

TEST_F(VellumDescription, OfARealPrinterIsComplete) {
    const VirtualPrinter real({.duplex = true});
    for (const std::string_view scheme : {"ipp", "ipps"}) {
        auto printer = printerAt(real.uri(scheme));
        EXPECT_EQ(printer.name(), "Acme Laser") << scheme;
        EXPECT_EQ(printer.product(), "(Acme Laser)") << scheme;
        EXPECT_EQ(printer.duplex(), "T") << scheme;
        EXPECT_EQ(printer.difficulty(), std::nullopt) << scheme;
    }
}

}  // namespace
}  // namespace ventras
