#include "platform/linux/options/PrinterAddress.h"

#include <gtest/gtest.h>

#include "platform/linux/options/LocalServiceResolver.h"

namespace ventras {
namespace {

struct AddressCase {
    const char* uri;
    PrinterService service;
    const char *host, *resource, *printerURI;
    int port;
    http_encryption_t encryption;
};
constexpr AddressCase kAddresses[] = {
    {"ipp://printer.example/ipp/print", PrinterService::Print, "printer.example", "/ipp/print",
     "ipp://printer.example/ipp/print", 631, HTTP_ENCRYPTION_IF_REQUESTED},
    {"ipp://printer.example:8631/printers/a", PrinterService::Print, "printer.example", "/printers/a",
     "ipp://printer.example:8631/printers/a", 8631, HTTP_ENCRYPTION_IF_REQUESTED},
    {"ipps://printer.example/ipp/print", PrinterService::Print, "printer.example", "/ipp/print",
     "ipps://printer.example/ipp/print", 631, HTTP_ENCRYPTION_ALWAYS},
    {"ipp://[2001:db8::1]/ipp/print", PrinterService::Print, "2001:db8::1", "/ipp/print",
     "ipp://[2001:db8::1]/ipp/print", 631, HTTP_ENCRYPTION_IF_REQUESTED},
    {"ipp://printer.example/ipp/print?waitjob=false", PrinterService::Print, "printer.example", "/ipp/print",
     "ipp://printer.example/ipp/print", 631, HTTP_ENCRYPTION_IF_REQUESTED},
    {"ipp://printer.example", PrinterService::Print, "printer.example", "/", "ipp://printer.example/", 631,
     HTTP_ENCRYPTION_IF_REQUESTED},
    {"ipp://printer.example/ipp/print", PrinterService::FaxOut, "printer.example", "/ipp/faxout",
     "ipp://printer.example/ipp/faxout", 631, HTTP_ENCRYPTION_IF_REQUESTED},
};

TEST(PrinterAddress, IsInTheUri) {
    for (const auto& expected : kAddresses) {
        const auto address = PrinterAddress::find(expected.uri, expected.service);
        ASSERT_TRUE(address) << expected.uri;
        EXPECT_EQ(address->host, expected.host) << expected.uri;
        EXPECT_EQ(address->port, expected.port) << expected.uri;
        EXPECT_EQ(address->resource, expected.resource) << expected.uri;
        EXPECT_EQ(address->encryption, expected.encryption) << expected.uri;
        EXPECT_EQ(address->uri, expected.printerURI) << expected.uri;
    }
}

TEST(PrinterAddress, IsAbsentForAUriThatMakesNoSense) {
    for (const auto* uri : {"", "ipp", "ipp://", "ipp:///ipp/print", "ipp://h:99999999/", "ipp://[::1",
                            "ippusb://elsewhere.example/", "ippusb:///"})
        EXPECT_FALSE(PrinterAddress::find(uri, PrinterService::Print)) << uri;
}

using namespace std::string_literals;

TEST(ServiceRecord, HasItsPortBehindPriorityAndWeight) {
    EXPECT_EQ(portInServiceRecord("\0\0\0\0\x02\x77\x09localhost\0"s), 631);
    EXPECT_EQ(portInServiceRecord("\0\0\0\0\xEA\x60"s), 60000);
    EXPECT_EQ(portInServiceRecord("\0\0\0\0\0\0\0"s), std::nullopt);
    EXPECT_EQ(portInServiceRecord("\0\0\0\0\x02"s), std::nullopt);
    EXPECT_EQ(portInServiceRecord(""), std::nullopt);
}

TEST(TextRecord, HasValuesUnderKeys) {
    const auto record =
        "\x0Crp=ipp/print\x0Erfo=ipp/faxout\x04"
        "flag\x04"
        "a=b=\x02x="s;
    EXPECT_EQ(valueInTextRecord(record, "rp"), "ipp/print");
    EXPECT_EQ(valueInTextRecord(record, "RP"), "ipp/print");
    EXPECT_EQ(valueInTextRecord(record, "rfo"), "ipp/faxout");
    EXPECT_EQ(valueInTextRecord(record, "a"), "b=");
    EXPECT_EQ(valueInTextRecord(record, "x"), "");
    EXPECT_EQ(valueInTextRecord(record, "flag"), "");
    EXPECT_EQ(valueInTextRecord(record, "none"), "");
    EXPECT_EQ(valueInTextRecord(record, ""), "");
}

TEST(TextRecord, IsReadNoFurtherThanItGoes) {
    EXPECT_EQ(valueInTextRecord("\xFFrp=x"s, "rp"), "x");
    EXPECT_EQ(valueInTextRecord("\x05"s, "rp"), "");
    EXPECT_EQ(valueInTextRecord("\0\0\x04rp=y"s, "rp"), "y");
    EXPECT_EQ(valueInTextRecord("", "rp"), "");
}

}  // namespace
}  // namespace ventras
