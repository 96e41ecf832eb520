#include "queues/QueueInventory.h"

#include <gtest/gtest.h>

#include <array>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "platform/PropertyList.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/queues/ScriptedScheduler.h"

namespace ventras {

void PrintTo(const QueueRecord& record, std::ostream* out) {
    *out << record.printerName.value_or("-") << ' ' << record.deviceURI.value_or("-") << ' '
         << record.printerType.value_or(-1);
}

namespace {

using Records = std::optional<QueueRecords>;
using Name = std::optional<std::string>;

std::vector<std::string> namesOf(const Records& records) {
    std::vector<std::string> names;
    for (const auto& record : records.value_or(QueueRecords{}))
        names.push_back(record.printerName.value_or("-"));
    return names;
}

// Definitions as the scheduler stores them: it takes any scheme from there, having a backend or not.
std::string storedQueues(const std::vector<std::pair<std::string, std::string>>& queues) {
    std::string text;
    for (const auto& [name, uri] : queues)
        text +=
            "<Printer " + name + ">\nDeviceURI " + uri + "\nState Idle\nType 4\nAccepting Yes\n</Printer>\n";
    return text;
}

PropertyDictionary savedQueue(const std::string& name, const std::string& uri, std::int64_t type) {
    return {{"printer-name", name}, {"device-uri", uri}, {"printer-type", type}};
}

class Inventory : public testing::Test {
protected:
    // The inventory of a computer whose saved list holds `text`.
    QueueInventory withSavedList(const std::string& text) {
        return QueueInventory(fake_.platform, folder_.write("printers.plist", text));
    }
    QueueInventory withSavedQueues(const PropertyValue& list) {
        return withSavedList(*xmlPropertyList(list));
    }
    QueueInventory withoutSavedList() { return QueueInventory(fake_.platform, folder_ / "missing.plist"); }

    TemporaryFolder folder_;
    FakePlatform fake_;
};

TEST_F(Inventory, HoldsTheQueuesOfTheAcceptedSchemesOnly) {
    const PrivateScheduler scheduler({.printers = storedQueues({
                                          {"a-usb", "usb://Acme/Laser?serial=1"},
                                          {"b-mdns", "mdns://x._ipp._tcp.local./"},
                                          {"c-dnssd", "dnssd://x._ipp._tcp.local./"},
                                          {"d-ipp", "ipp://127.0.0.1/ipp/print"},
                                          {"e-ipps", "ipps://127.0.0.1/ipp/print"},
                                          {"f-lpd", "lpd://127.0.0.1/queue"},
                                          {"g-sockt", "sockt://127.0.0.1"},
                                          {"h-ippusb", "ippusb://x/ipp/print"},
                                          {"i-riousb", "riousb://x"},
                                          {"j-socket", "socket://127.0.0.1:9100"},
                                          {"k-http", "http://127.0.0.1/"},
                                          {"l-file", "file:///dev/null"},
                                          {"m-usbx", "usbx://x"},
                                          {"n-xusb", "xusb://x"},
                                      })});
    const UseScheduler use(scheduler);
    EXPECT_EQ(namesOf(withoutSavedList().existingQueues()),
              (std::vector<std::string>{"a-usb", "b-mdns", "c-dnssd", "d-ipp", "e-ipps", "f-lpd", "g-sockt",
                                        "h-ippusb", "i-riousb"}));
}

TEST_F(Inventory, ComparesSchemesWithRegardToCase) {
    const ScriptedScheduler scheduler([](ipp_t* answer) {
        for (const char* uri : {"USB://x", "Ipp://x", "ipp://y"})
            addQueue(answer, uri, uri);
    });
    const UseScheduler use(scheduler.address());
    EXPECT_EQ(namesOf(withoutSavedList().existingQueues()), (std::vector<std::string>{"ipp://y"}));
}

TEST_F(Inventory, TellsNameURIAndTypeAsTheSchedulerHasThem) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("Laser", "usb://Acme/Laser%20Jet?serial=1");
    const UseScheduler use(scheduler);
    const auto queues = withoutSavedList().existingQueues();
    const auto type = std::stoll(scheduler.attribute("Laser", "printer-type"));
    EXPECT_EQ(queues, (QueueRecords{{"Laser", "usb://Acme/Laser%20Jet?serial=1", type}}));
}

TEST_F(Inventory, IsTakenAnewOnEveryCall) {
    const PrivateScheduler scheduler;
    const UseScheduler use(scheduler);
    const auto inventory = withoutSavedList();
    EXPECT_EQ(inventory.existingQueues(), std::nullopt);
    scheduler.addQueue("one", "ipp://127.0.0.1/1");
    EXPECT_EQ(namesOf(inventory.existingQueues()), (std::vector<std::string>{"one"}));
    scheduler.deleteQueue("one");
    EXPECT_EQ(inventory.existingQueues(), std::nullopt);
}

TEST_F(Inventory, IsAbsentWhenNoSchedulerAnswers) {
    const UseScheduler use((folder_ / "nobody").string());
    EXPECT_EQ(withoutSavedList().existingQueues(), std::nullopt);
    EXPECT_EQ(withoutSavedList().findQueueByDeviceURI("ipp://x"), std::nullopt);
}

TEST_F(Inventory, AsksForThreeAttributesOfAllPrinters) {
    const ScriptedScheduler scheduler([](ipp_t*) {});
    const UseScheduler use(scheduler.address());
    EXPECT_EQ(withoutSavedList().existingQueues(), std::nullopt);

    const auto requests = scheduler.requests();
    ASSERT_EQ(requests.size(), 1U);
    EXPECT_EQ(requests[0].resource, "/printers");
    const IppPtr request = decodeIpp(requests[0].body);
    EXPECT_EQ(ippGetOperation(request.get()), 0x4002);
    EXPECT_STREQ(ippGetString(ippFindAttribute(request.get(), "printer-uri", IPP_TAG_URI), 0, nullptr),
                 "ipp://localhost/printers/");
    auto* requested = ippFindAttribute(request.get(), "requested-attributes", IPP_TAG_KEYWORD);
    ASSERT_EQ(ippGetCount(requested), 3);
    EXPECT_STREQ(ippGetString(requested, 0, nullptr), "printer-name");
    EXPECT_STREQ(ippGetString(requested, 1, nullptr), "device-uri");
    EXPECT_STREQ(ippGetString(requested, 2, nullptr), "printer-type");
    auto* type = ippFindAttribute(request.get(), "printer-type", IPP_TAG_ENUM);
    ASSERT_NE(type, nullptr);
    EXPECT_EQ(ippGetInteger(type, 0), 0);
}

struct PrinterGroup {
    ipp_tag_t nameTag = IPP_TAG_NAME;
    ipp_tag_t uriTag = IPP_TAG_URI;
    ipp_tag_t typeTag = IPP_TAG_ENUM;  // IPP_TAG_ZERO: the attribute is missing
    ipp_tag_t group = IPP_TAG_PRINTER;
};

void addRun(ipp_t* answer, const PrinterGroup& run, const char* name) {
    if (run.nameTag != IPP_TAG_ZERO)
        ippAddString(answer, run.group, run.nameTag, "printer-name", nullptr, name);
    if (run.uriTag != IPP_TAG_ZERO)
        ippAddString(answer, run.group, run.uriTag, "device-uri", nullptr, "ipp://x");
    if (run.typeTag != IPP_TAG_ZERO)
        ippAddInteger(answer, run.group, run.typeTag, "printer-type", 4);
    ippAddSeparator(answer);
}

TEST_F(Inventory, KeepsOnlyQueuesThatTellAllThreeWithTheRightTags) {
    const std::vector<std::pair<std::string, PrinterGroup>> faulty{
        {"no name", {.nameTag = IPP_TAG_ZERO}},
        {"name as text", {.nameTag = IPP_TAG_TEXT}},
        {"name as keyword", {.nameTag = IPP_TAG_KEYWORD}},
        {"no URI", {.uriTag = IPP_TAG_ZERO}},
        {"URI as text", {.uriTag = IPP_TAG_TEXT}},
        {"no type", {.typeTag = IPP_TAG_ZERO}},
        {"type as integer", {.typeTag = IPP_TAG_INTEGER}},
        {"in another group", {.group = IPP_TAG_JOB}},
    };
    for (const auto& [what, run] : faulty) {
        const ScriptedScheduler scheduler([&run = run](ipp_t* answer) {
            addRun(answer, {}, "before");
            addRun(answer, run, "faulty");
            addRun(answer, {}, "after");
        });
        const UseScheduler use(scheduler.address());
        EXPECT_EQ(namesOf(withoutSavedList().existingQueues()), (std::vector<std::string>{"before", "after"}))
            << what;
    }
}

TEST_F(Inventory, TakesNothingOfAQueueFromItsNeighbours) {
    const ScriptedScheduler scheduler([](ipp_t* answer) {
        addRun(answer, {.uriTag = IPP_TAG_ZERO, .typeTag = IPP_TAG_ZERO}, "name");
        addRun(answer, {.nameTag = IPP_TAG_ZERO, .typeTag = IPP_TAG_ZERO}, "uri");
        addRun(answer, {.nameTag = IPP_TAG_ZERO, .uriTag = IPP_TAG_ZERO}, "type");
    });
    const UseScheduler use(scheduler.address());
    EXPECT_EQ(withoutSavedList().existingQueues(), std::nullopt);
}

TEST_F(Inventory, IgnoresOtherAttributesAndLaterValues) {
    const ScriptedScheduler scheduler([](ipp_t* answer) {
        ippAddString(answer, IPP_TAG_PRINTER, IPP_TAG_TEXT, "printer-info", nullptr, "Laser");
        constexpr std::array kNames{"first", "second"};
        ippAddStrings(answer, IPP_TAG_PRINTER, IPP_TAG_NAME, "printer-name", 2, nullptr, kNames.data());
        ippAddString(answer, IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, "ipp://x");
        constexpr std::array kTypes{4, 8};
        ippAddIntegers(answer, IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-type", 2, kTypes.data());
    });
    const UseScheduler use(scheduler.address());
    EXPECT_EQ(withoutSavedList().existingQueues(), (QueueRecords{{"first", "ipp://x", 4}}));
}

TEST_F(Inventory, DoesNotReadTheSavedListWhileTheSchedulerRuns) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("real", "ipp://127.0.0.1/1");
    const UseScheduler use(scheduler);
    EXPECT_EQ(namesOf(withSavedQueues(PropertyArray{savedQueue("saved", "ipp://x", 4)}).existingQueues()),
              (std::vector<std::string>{"real"}));
}

TEST_F(Inventory, TrustsTheSavedListWhenNoProcessOfTheSchedulersNameIsThere) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("real", "ipp://127.0.0.1/1");
    const UseScheduler use(scheduler);
    const auto inventory = withSavedQueues(PropertyArray{savedQueue("saved", "socket://x", 4)});
    using Processes = std::map<std::string, pid_t, std::less<>>;
    for (const auto& processes :
         std::vector<Processes>{{}, {{"cupsd", 0}}, {{"cupsd-helper", 7}}, {{"CUPSD", 7}}}) {
        fake_.processes.processes = processes;
        EXPECT_EQ(inventory.existingQueues(), (QueueRecords{{"saved", "socket://x", 4}}))
            << (processes.empty() ? "none" : processes.begin()->first);
    }
}

class SavedList : public Inventory {
protected:
    SavedList() {
        fake_.processes.processes.clear();
        scheduler_.addQueue("real", "ipp://127.0.0.1/1");
    }

    PrivateScheduler scheduler_;
    UseScheduler use_{scheduler_};
};

TEST_F(SavedList, ThatIsEmptyMeansNoQueueWhateverTheSchedulerKnows) {
    EXPECT_EQ(withSavedQueues(PropertyArray{}).existingQueues(), std::nullopt);
}

TEST_F(SavedList, ThatIsMissingOrNoListLeavesTheQuestionToTheScheduler) {
    EXPECT_EQ(namesOf(withoutSavedList().existingQueues()), (std::vector<std::string>{"real"}));
    for (const std::string text : {"", "no property list", "<plist><array>", "bplist00", "\x01\x02"})
        EXPECT_EQ(namesOf(withSavedList(text).existingQueues()), (std::vector<std::string>{"real"})) << text;
    for (const PropertyValue& value : {PropertyValue("text"), PropertyValue(PropertyDictionary{{"a", "b"}})})
        EXPECT_EQ(namesOf(withSavedQueues(value).existingQueues()), (std::vector<std::string>{"real"}));
}

TEST_F(SavedList, ThatIsAFolderLeavesTheQuestionToTheScheduler) {
    const QueueInventory inventory(fake_.platform, folder_.path());
    EXPECT_EQ(namesOf(inventory.existingQueues()), (std::vector<std::string>{"real"}));
}

TEST_F(SavedList, IsTakenAsItStandsInItsOrder) {
    EXPECT_EQ(withSavedQueues(PropertyArray{savedQueue("z", "socket://x", 1), savedQueue("a", "USB://x", 2),
                                            PropertyDictionary{{"printer-name", "nowhere"}},
                                            PropertyDictionary{{"device-uri", "ipp://nameless"}}})
                  .existingQueues(),
              (QueueRecords{{"z", "socket://x", 1},
                            {"a", "USB://x", 2},
                            {"nowhere", std::nullopt, std::nullopt},
                            {std::nullopt, "ipp://nameless", std::nullopt}}));
}

TEST_F(SavedList, MayHoldValuesOfOtherKindsThatAreNotTaken) {
    EXPECT_EQ(withSavedQueues(PropertyArray{"text", std::int64_t{1},
                                            PropertyDictionary{{"printer-name", std::int64_t{1}},
                                                               {"device-uri", "ipp://x"},
                                                               {"printer-type", "4"}}})
                  .existingQueues(),
              (QueueRecords{{std::nullopt, "ipp://x", std::nullopt}}));
}

TEST_F(SavedList, AnswersTheLookupToo) {
    const auto inventory = withSavedQueues(
        PropertyArray{savedQueue("saved", "usb://x", 1), PropertyDictionary{{"device-uri", "usb://y"}}});
    EXPECT_EQ(inventory.findQueueByDeviceURI("usb://x"), "saved");
    EXPECT_EQ(inventory.findQueueByDeviceURI("usb://y"), "");
    EXPECT_EQ(inventory.findQueueByDeviceURI("ipp://127.0.0.1/1"), std::nullopt);
}

TEST_F(Inventory, FindsAQueueByItsExactURI) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("laser", "usb://Acme/Laser?serial=1");
    scheduler.addQueue("socket", "socket://127.0.0.1:9100");
    const UseScheduler use(scheduler);
    const std::vector<std::pair<std::string, Name>> cases{
        {"usb://Acme/Laser?serial=1", "laser"},
        {"usb://acme/laser?serial=1", std::nullopt},
        {"USB://Acme/Laser?serial=1", std::nullopt},
        {"usb://Acme/Laser?serial=", std::nullopt},
        {"usb://Acme/Laser?serial=12", std::nullopt},
        {"socket://127.0.0.1:9100", std::nullopt},
        {"", std::nullopt},
    };
    for (const auto& [uri, expected] : cases)
        EXPECT_EQ(withoutSavedList().findQueueByDeviceURI(uri), expected) << uri;
}

TEST_F(Inventory, FindsTheFirstOfTwoQueuesForOneURI) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("b", "usb://Acme/Laser");
    scheduler.addQueue("a", "usb://Acme/Laser");
    const UseScheduler use(scheduler);
    const auto inventory = withoutSavedList();
    EXPECT_EQ(inventory.findQueueByDeviceURI("usb://Acme/Laser"),
              inventory.existingQueues()->front().printerName);
}

TEST_F(Inventory, MayBeTakenByManyThreadsAtOnce) {
    const PrivateScheduler scheduler;
    scheduler.addQueue("laser", "usb://Acme/Laser");
    const UseScheduler use(scheduler);
    const auto inventory = withoutSavedList();
    std::vector<Name> found(8);
    {
        std::vector<std::jthread> threads;
        for (auto& name : found)
            threads.emplace_back([&] { name = inventory.findQueueByDeviceURI("usb://Acme/Laser"); });
    }
    EXPECT_EQ(found, std::vector<Name>(8, "laser"));
}

}  // namespace
}  // namespace ventras
