#include <gtest/gtest.h>

#include "platform/Handles.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

const std::string kColourDuplex = readFile(testDocument("colour-duplex.ppd"));

std::string ask(const VirtualPrinter& printer, const std::string& uri) {
    return runProgram({"ipptool", "-tv", uri, "get-printer-attributes.test"}, {}, 30s).standardOutput +
           printer.log();
}

TEST(VirtualPrinter, ReportsWhatItWasMadeAs) {
    const VirtualPrinter printer(
        {.name = "Office", .model = "ColorJet", .location = "Hall", .duplex = true, .colour = true});
    const auto answer = ask(printer, printer.uri());
    EXPECT_NE(answer.find("printer-name (nameWithoutLanguage) = Office"), std::string::npos) << answer;
    EXPECT_NE(answer.find("= Acme ColorJet"), std::string::npos) << answer;
    EXPECT_NE(answer.find("= Hall"), std::string::npos) << answer;
    EXPECT_NE(answer.find("two-sided-long-edge"), std::string::npos) << answer;
    EXPECT_NE(answer.find("color-supported (boolean) = true"), std::string::npos) << answer;
    EXPECT_NE(answer.find("application/pdf,image/urf"), std::string::npos) << answer;
}

TEST(VirtualPrinter, IsPlainUnlessAskedOtherwise) {
    const VirtualPrinter printer;
    const auto answer = ask(printer, printer.uri());
    EXPECT_EQ(answer.find("two-sided-long-edge"), std::string::npos) << answer;
    EXPECT_NE(answer.find("color-supported (boolean) = false"), std::string::npos) << answer;
}

TEST(VirtualPrinter, AnswersOnEveryAddressWithAndWithoutTls) {
    const VirtualPrinter printer({.name = "Everywhere"});
    for (const auto* scheme : {"ipp", "ipps"})
        for (const auto* host : {"localhost", "127.0.0.1", "[::1]"}) {
            const auto answer = ask(printer, printer.uri(scheme, host));
            EXPECT_NE(answer.find("= Everywhere"), std::string::npos) << printer.uri(scheme, host) << answer;
        }
}

TEST(VirtualPrinter, KeepsWhatItIsSentByAScheduler) {
    const PrivateScheduler scheduler;
    const VirtualPrinter printer({.name = "Paper", .duplex = true, .colour = true});
    scheduler.addQueue("Plain", printer.uri("ipp"), kColourDuplex);
    scheduler.addQueue("Secret", printer.uri("ipps"), kColourDuplex);
    EXPECT_FALSE(printer.receivedWithin(0ms));
    scheduler.print("Plain", "hello.pdf");
    ASSERT_TRUE(printer.receivedWithin(30s)) << scheduler.errorLog() << printer.log();
    scheduler.print("Secret", "hello.txt");
    ASSERT_TRUE(printer.receivedWithin(30s, 2)) << scheduler.errorLog() << printer.log();
    for (const auto& document : printer.received()) {
        EXPECT_EQ(document.contentType, "image/urf");
        EXPECT_GT(std::filesystem::file_size(document.file), 1000U);
    }
}

TEST(VirtualPrinter, KnowsAPdfWhenItGetsOne) {
    const PrivateScheduler scheduler;
    const VirtualPrinter printer;
    scheduler.addQueue("Raw", printer.uri());
    scheduler.print("Raw", "hello.pdf");
    ASSERT_TRUE(printer.receivedWithin(30s)) << scheduler.errorLog() << printer.log();
    EXPECT_EQ(printer.received().front().contentType, "application/pdf");
    EXPECT_EQ(readFile(printer.received().front().file), readFile(testDocument("hello.pdf")));
}

}  // namespace
}  // namespace ventras
