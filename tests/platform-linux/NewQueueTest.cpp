#include "platform/linux/scheduler/NewQueue.h"

#include <gtest/gtest.h>

#include "platform/PropertyList.h"
#include "platform/QueueAttributes.h"

namespace ventras {
namespace {

const PropertyDictionary kAttributes{
    {"Printer URI", "ipp://printer.example/ipp/print"},
    {"com.quillon.print.PrinterInfo.PPD", "/tmp/x.ppd"},
    {"MANUFACTURER:", "Acme"},
    {"Location", "Lab 2"},
};
const std::map<std::string, std::string> kOptions{{"PC WSItem User Name", "Acme Laser"}};

std::variant<NewQueue, Refusal> parse(const PropertyDictionary& attributes, const std::string& id = "Laser",
                                      const std::map<std::string, std::string>& options = kOptions) {
    return NewQueue::parse(id, xmlPropertyList(attributes).value_or("unwritable"), options);
}

PropertyDictionary with(std::string_view key, const PropertyValue& value) {
    auto attributes = kAttributes;
    attributes.insert_or_assign(std::string(key), value);
    return attributes;
}

NewQueue require(const std::variant<NewQueue, Refusal>& parsed) {
    if (const auto* refusal = std::get_if<Refusal>(&parsed)) {
        ADD_FAILURE() << refusal->reason;
        return {};
    }
    return std::get<NewQueue>(parsed);
}

std::int32_t statusOf(const std::variant<NewQueue, Refusal>& parsed) {
    const auto* refusal = std::get_if<Refusal>(&parsed);
    return refusal == nullptr ? 0 : refusal->status;
}

TEST(NewQueue, TakesItsSettingsFromTheAttributes) {
    const auto queue = require(parse(kAttributes));
    EXPECT_EQ(queue.queueID, "Laser");
    EXPECT_EQ(queue.deviceURI, "ipp://printer.example/ipp/print");
    EXPECT_EQ(queue.ppdPath, "/tmp/x.ppd");
    EXPECT_EQ(queue.location, "Lab 2");
    EXPECT_EQ(queue.displayName, "Acme Laser");
}

TEST(NewQueue, NeedsNeitherLocationNorDisplayName) {
    auto attributes = kAttributes;
    attributes.erase("Location");
    const auto queue = require(parse(attributes, "Laser", {}));
    EXPECT_EQ(queue.location, "");
    EXPECT_EQ(queue.displayName, "");
}

struct SchemeCase {
    const char* uri;
    DriverKind kind;
};
constexpr SchemeCase kSchemes[] = {
    {"usb://Acme/Laser?serial=1", DriverKind::Catalogue},
    {"ipp://host/ipp/print", DriverKind::Driverless},
    {"ipps://host:443/ipp/print", DriverKind::Driverless},
    {"ippusb://Laser._ipp._tcp.local./", DriverKind::Driverless},
    {"mdns://some-uuid", DriverKind::ScannerOnly},
    {"bluetooth://some-uuid", DriverKind::ScannerOnly},
    {"file:///dev/null", DriverKind::ScannerOnly},
};

TEST(NewQueue, HasTheKindOfDriverThatItsDeviceNeeds) {
    for (const auto& [uri, kind] : kSchemes)
        EXPECT_EQ(require(parse(with("Printer URI", uri))).driverKind, kind) << uri;
}

TEST(NewQueue, IsAScannersWhenTheAttributesSaySo) {
    auto attributes = with("Printer URI", "usb://some-uuid");
    attributes.emplace("Scanner", true);
    EXPECT_EQ(require(parse(attributes)).driverKind, DriverKind::ScannerOnly);
    attributes["Scanner"] = false;
    EXPECT_EQ(require(parse(attributes)).driverKind, DriverKind::Catalogue);
}

TEST(NewQueue, IsRefusedForOtherDevices) {
    for (const auto* uri :
         {"", "socket://host", "lpd://host/queue", "file:///etc/passwd", "file:///dev/null/..",
          "beh://1/1/1/file:///x", "http://host/", "cups-pdf:/", "serial:/dev/ttyS0", "usb", "ipp",
          "IPP://host/ipp/print", "ipp:/host", "://", "nonsense"})
        EXPECT_EQ(statusOf(parse(with("Printer URI", uri))), PrintSystemStatus::kBadData) << uri;
}

TEST(NewQueue, IsNotAvailableWhereThePrinterGaveNothingToMakeADriverOf) {
    auto attributes = with("Printer URI", "ippusb://Laser._ipp._tcp.local./");
    attributes.erase("com.quillon.print.PrinterInfo.PPD");
    EXPECT_EQ(statusOf(parse(attributes)), PrintSystemStatus::kUnavailable);
}

TEST(NewQueue, IsRefusedWithControlCharacters) {
    for (const auto* text : {"a\nb", "a\tb", "a\rb",
                             "a\x7f"
                             "b",
                             "a\xC2\x85"
                             "b"}) {
        EXPECT_EQ(statusOf(parse(with("Location", text))), PrintSystemStatus::kBadData) << text;
        EXPECT_EQ(statusOf(parse(with("Printer URI", "ipp://host/" + std::string(text)))),
                  PrintSystemStatus::kBadData)
            << text;
        EXPECT_EQ(statusOf(parse(kAttributes, "Laser", {{"PC WSItem User Name", text}})),
                  PrintSystemStatus::kBadData)
            << text;
        EXPECT_EQ(statusOf(parse(kAttributes, text)), PrintSystemStatus::kBadData) << text;
    }
}

TEST(NewQueue, IsRefusedWithBrokenUtf8) {
    EXPECT_EQ(statusOf(parse(kAttributes, "Laser", {{"PC WSItem User Name", "\xFF"}})),
              PrintSystemStatus::kBadData);
    EXPECT_EQ(statusOf(parse(kAttributes, "\xFF")), PrintSystemStatus::kBadData);
}

TEST(NewQueue, IsRefusedUnderANameThatTheSchedulerRefuses) {
    for (const auto* name : {"", "a b", "a/b", "a#b"})
        EXPECT_EQ(statusOf(parse(kAttributes, name)), PrintSystemStatus::kBadData) << name;
    EXPECT_EQ(statusOf(parse(kAttributes, std::string(128, 'a'))), PrintSystemStatus::kBadData);
}

TEST(NewQueue, HasItsTextsCutBetweenCharacters) {
    const auto text = std::string(126, 'a') + "\xC3\xBC" + std::string(300, 'b');
    const auto queue = require(parse(with("Location", text), "Laser", {{"PC WSItem User Name", text}}));
    EXPECT_EQ(queue.location, std::string(126, 'a'));
    EXPECT_EQ(queue.displayName, std::string(126, 'a'));
}

TEST(NewQueue, IsRefusedWithAnEndlessDeviceUri) {
    EXPECT_EQ(statusOf(parse(with("Printer URI", "ipp://h/" + std::string(1016, 'a')))),
              PrintSystemStatus::kBadData);
    EXPECT_EQ(statusOf(parse(with("Printer URI", "ipp://h/" + std::string(1015, 'a')))), 0);
}

TEST(NewQueue, IsRefusedWithoutAPropertyListDictionary) {
    for (const auto* list : {"", "nonsense", "<plist><string>x</string></plist>", "<plist><array/></plist>"})
        EXPECT_EQ(statusOf(NewQueue::parse("Laser", list, kOptions)), PrintSystemStatus::kBadData) << list;
}

TEST(NewQueue, TakesNoSettingOfAnotherKind) {
    EXPECT_EQ(statusOf(parse(with("Printer URI", 5))), PrintSystemStatus::kBadData);
    EXPECT_EQ(require(parse(with("Location", true))).location, "");
}

}  // namespace
}  // namespace ventras
