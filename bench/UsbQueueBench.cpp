// How long the agent takes to make the queue of one USB printer, against the scheduler's own times for the
// requests that this takes, in the same run: a real scheduler, real collections of drivers among as many
// others as a distribution brings, and an emulated USB.
#include <array>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "bench/SpeedTable.h"
#include "bench/Stopwatch.h"
#include "bench/TimedProgram.h"
#include "platform/IppConnection.h"
#include "platform/TemporaryFile.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/UsbBench.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

constexpr int kAlternations = 21;
constexpr int kOtherDrivers = 4000;
constexpr const char* kLocation = "-u20971520,0";  // 1-4
constexpr const char* kDeviceURI = "usb://Brother/DCP-7030?serial=B7";
constexpr const char* kDriver = "drv:///Library/brlaser.drv/br7030.ppd";

void setEnvironment(const Environment& environment) {
    for (const auto& [name, value] : environment)
        setenv(name.c_str(), value.c_str(), 1);
}

std::string driverOfAnother(int number) {
    const auto model = "Acme " + std::to_string(number);
    return "*PPD-Adobe: \"4.3\"\n*FormatVersion: \"4.3\"\n*FileVersion: \"1\"\n*LanguageVersion: English\n"
           "*LanguageEncoding: ISOLatin1\n*PCFileName: \"ACME.PPD\"\n*Manufacturer: \"Acme\"\n*Product: \"(" +
           model + ")\"\n*ModelName: \"" + model + "\"\n*ShortNickName: \"" + model + "\"\n*NickName: \"" +
           model + "\"\n*1284DeviceID: \"MFG:Acme;MDL:" + std::to_string(number) + ";CMD:POSTSCRIPT;\"\n" +
           "*PSVersion: \"(3010) 1\"\n*LanguageLevel: \"3\"\n";
}

std::map<std::string, std::string> otherDrivers(int count) {
    std::map<std::string, std::string> drivers;
    for (int i = 0; i < count; ++i)
        drivers.emplace("acme" + std::to_string(i) + ".ppd", driverOfAnother(i));
    return drivers;
}

IppPtr driversRequest() {
    constexpr std::array kSchemes{"drv", "file", "gutenprint*"};
    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PPDS)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes", nullptr, "all");
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "include-schemes",
                  static_cast<int>(kSchemes.size()), nullptr, kSchemes.data());
    return request;
}

IppPtr driverRequest() {
    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PPD)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_NAME, "ppd-name", nullptr, kDriver);
    return request;
}

IppPtr queuesRequest() {
    constexpr std::array kAttributes{"printer-name", "device-uri", "printer-type"};
    IppPtr request{ippNewRequest(IPP_OP_CUPS_GET_PRINTERS)};
    ippAddStrings(request.get(), IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                  static_cast<int>(kAttributes.size()), nullptr, kAttributes.data());
    return request;
}

IppPtr creationRequest() {
    IppPtr request{ippNewRequest(IPP_OP_CUPS_ADD_MODIFY_PRINTER)};
    ippAddString(request.get(), IPP_TAG_OPERATION, IPP_TAG_URI, "printer-uri", nullptr,
                 "ipp://localhost/printers/Plain");
    ippAddString(request.get(), IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, kDeviceURI);
    ippAddBoolean(request.get(), IPP_TAG_PRINTER, "printer-is-accepting-jobs", 1);
    ippAddInteger(request.get(), IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-state", IPP_PSTATE_IDLE);
    return request;
}

// What the scheduler takes for each request that makes one such queue, over one connection.
struct SchedulerTimes {
    std::vector<double> drivers, driver, queues, creation;
};

class UsbQueueBench {
public:
    explicit UsbQueueBench(int otherDriverCount) : scheduler_({.models = otherDrivers(otherDriverCount)}) {
        const auto data = scheduler_.folder() / "data/drv/Library";
        fs::create_directories(data);
        for (const auto* collection : {"brlaser.drv", "sample.drv"})
            fs::copy(fs::path("/usr/share/cups/drv") / collection, data);
        FakePrinterModel model;
        model.deviceID = "MFG:Brother;CMD:PJL,HBP;MDL:DCP-7030;CLS:PRINTER;SN:B7;";
        usb_.plugIn("1-4", std::move(model));
        setEnvironment(scheduler_.environment());
        setEnvironment({{"XDG_CONFIG_HOME", preferences_.path()}});
        setEnvironment(usb_.environment());  // of the agent, from now on: this process sees no emulation
    }

    void measure(SpeedTable& table) {
        agent();
        SchedulerTimes times;
        std::vector<double> agentTimes;
        for (int i = 0; i < kAlternations; ++i) {
            askScheduler(times);
            agentTimes.push_back(agent());
        }
        // The agent looks at the queues before it chooses a driver, and again when it holds the device.
        const double own =
            median(times.drivers) + median(times.driver) + 2 * median(times.queues) + median(times.creation);
        table.note("Scheduler: its drivers (CUPS-Get-PPDs)", median(times.drivers), "ms");
        table.note("Scheduler: one driver (CUPS-Get-PPD)", median(times.driver), "ms");
        table.note("Scheduler: its queues (CUPS-Get-Printers), asked twice", median(times.queues), "ms");
        table.note("Scheduler: a new queue (CUPS-Add-Modify-Printer)", median(times.creation), "ms");
        table.note("Scheduler: together", own, "ms");
        table.note("1 USB printer: agent, start to exit, queue ready", median(agentTimes), "ms");
        table.atMost("1 USB printer: agent / scheduler", median(agentTimes) / own, 1.3, "");
    }

private:
    static void ask(IppConnection& scheduler, IppPtr request, std::vector<double>& times, int document = -1,
                    int received = -1) {
        const auto* const resource = document < 0 ? "/" : "/admin/";
        const Stopwatch stopwatch;
        const auto answer = scheduler.exchange(std::move(request), resource, document, received);
        times.push_back(stopwatch.milliseconds());
        if (!answer.succeeded() && answer.status != IPP_STATUS_ERROR_NOT_FOUND)
            throw std::runtime_error("the scheduler says: " + answer.reason);
    }

    void askScheduler(SchedulerTimes& times) const {
        auto scheduler = IppConnection::toScheduler();
        auto ppd = TemporaryFile::create();
        ask(scheduler, queuesRequest(), times.queues);
        ask(scheduler, driversRequest(), times.drivers);
        ask(scheduler, driverRequest(), times.driver, -1, ppd->descriptor());
        ask(scheduler, creationRequest(), times.creation, ppd->descriptor());
        scheduler_.deleteQueue("Plain");
    }

    double agent() const {
        const auto cost = timedRun({VENTRAS_AGENT, kLocation});
        const auto made = scheduler_.queues();
        if (made.size() != 1 || scheduler_.attribute(made.front(), "device-uri") != kDeviceURI)
            throw std::runtime_error("the agent made no queue for the printer");
        scheduler_.deleteQueue(made.front());
        return cost.milliseconds;
    }

    PrivateScheduler scheduler_;
    UseScheduler use_{scheduler_};
    UsbBench usb_;
    TemporaryFolder preferences_;
};

void measure(SpeedTable& table) {
    UsbQueueBench(kOtherDrivers).measure(table);
}

}  // namespace
}  // namespace ventras

int main() {
    return ventras::tabulate("usb-queue-bench", ventras::measure);
}
