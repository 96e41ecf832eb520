// How long the agent takes to make queues for IPP printers, against the print system's own tool for the same
// printers in the same run: a real scheduler, a real virtual printer, and scripted printers by the dozen.
#include <chrono>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "bench/SpeedTable.h"
#include "bench/Stopwatch.h"
#include "bench/TimedProgram.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/parts/ScriptedPrinter.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/parts/VirtualPrinter.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Strings = std::vector<std::string>;

constexpr int kAlternations = 31;
constexpr int kBigAlternations = 5;
// CUPS 2.4.2 makes the driver on a thread of its own, and crashes now and then when asked for something
// meanwhile.
constexpr auto kThreadsEnd = 30ms;
constexpr std::size_t kManyPrinters = 50;

using Printers = std::vector<std::unique_ptr<ScriptedPrinter>>;

Printers scriptedPrinters(std::size_t count, std::chrono::milliseconds delay) {
    Printers printers;
    for (std::size_t i = 0; i < count; ++i)
        printers.push_back(std::make_unique<ScriptedPrinter>(
            ScriptedPrinterOptions{.name = "Printer " + std::to_string(i), .delay = delay}));
    return printers;
}

Strings uris(const Printers& printers) {
    Strings uris;
    for (const auto& printer : printers)
        uris.push_back(printer->uri());
    return uris;
}

class IppQueueBench {
public:
    // Before any printer has a thread: what follows is this process's environment and every program's.
    IppQueueBench() {
        auto environment = scheduler_.environment();
        environment["XDG_CONFIG_HOME"] = preferences_.path();
        environment["PATH"] = std::string(std::getenv("PATH")) + ":/usr/sbin";
        for (const auto& [name, value] : environment)
            setenv(name.c_str(), value.c_str(), 1);
    }

    void onePrinter(SpeedTable& table) {
        const VirtualPrinter printer{{.duplex = true, .colour = true}};
        agent({printer.uri()});
        lpadmin({printer.uri()});
        std::vector<double> agentTimes;
        std::vector<double> lpadminTimes;
        std::vector<double> usableTimes;
        for (int i = 0; i < kAlternations; ++i) {
            agentTimes.push_back(agent({printer.uri()}).milliseconds);
            const auto [returned, usable] = lpadmin({printer.uri()});
            lpadminTimes.push_back(returned);
            usableTimes.push_back(usable);
        }
        const double agentTime = median(agentTimes);
        const double lpadminTime = median(lpadminTimes);
        table.note("1 printer: agent, start to exit, queue ready", agentTime, "ms");
        table.note("1 printer: lpadmin -m everywhere, start to exit", lpadminTime, "ms");
        table.note("1 printer: lpadmin -m everywhere, until the queue has its PPD", median(usableTimes),
                   "ms");
        table.atMost("1 printer: agent / lpadmin", agentTime / lpadminTime, 3, "");
    }

    void manyPrintersAtOnce(SpeedTable& table) {
        const auto printers = scriptedPrinters(kManyPrinters, 0ms);
        std::vector<double> agentTimes;
        std::vector<double> lpadminTimes;
        std::vector<double> peaks;
        for (int i = 0; i < kBigAlternations; ++i) {
            const auto cost = agent(uris(printers));
            agentTimes.push_back(cost.milliseconds);
            peaks.push_back(cost.peakMebibytes);
            lpadminTimes.push_back(lpadmin(uris(printers)).returned);
        }
        table.note("50 printers: agent, one command line", median(agentTimes), "ms");
        table.note("50 printers: lpadmin, one after another", median(lpadminTimes), "ms");
        table.atMost("50 printers: agent / lpadmin", median(agentTimes) / median(lpadminTimes), 1, "");
        table.atMost("50 printers: peak resident memory of the agent", median(peaks), 48, "MiB");
    }

    void manySlowPrinters(SpeedTable& table) {
        const auto printers = scriptedPrinters(kManyPrinters, 500ms);
        table.atMost("50 printers that answer after 0.5 s: agent", agent(uris(printers)).milliseconds, 2000,
                     "ms");
    }

    void oneSilentPrinter(SpeedTable& table) {
        auto printers = scriptedPrinters(kManyPrinters - 1, 500ms);
        printers.insert(printers.begin() + kManyPrinters / 2,
                        std::make_unique<ScriptedPrinter>(ScriptedPrinterOptions{.fault = Fault::silent}));
        Strings command = uris(printers);
        command.insert(command.begin(), VENTRAS_AGENT);
        const Stopwatch stopwatch;
        RunningProgram run(command);
        while (scheduler_.queues().size() < kManyPrinters - 1) {
            if (stopwatch.milliseconds() > 60'000)
                throw std::runtime_error("one silent printer keeps the queues of the others from being made");
            std::this_thread::sleep_for(5ms);
        }
        const auto elapsed = stopwatch.milliseconds();
        run.end();
        table.atMost("49 such printers and a silent one: until the 49 queues are there", elapsed, 2000, "ms");
        deleteQueues();
    }

private:
    struct LpadminTimes {
        double returned = 0;
        double usable = 0;
    };

    // lpadmin returns before the scheduler has asked the printer anything; the queue takes documents only
    // later.
    LpadminTimes lpadmin(const Strings& printers) {
        LpadminTimes sum;
        for (std::size_t i = 0; i < printers.size(); ++i) {
            const auto queue = "P" + std::to_string(i);
            const Stopwatch stopwatch;
            sum.returned +=
                timedRun({"lpadmin", "-p", queue, "-E", "-v", printers[i], "-m", "everywhere"}).milliseconds;
            if (!PrivateScheduler::appears(scheduler_.folder() / "etc/ppd" / (queue + ".ppd")))
                throw std::runtime_error("lpadmin made no driver for " + queue);
            sum.usable += stopwatch.milliseconds();
            std::this_thread::sleep_for(kThreadsEnd);
        }
        deleteQueues();
        return sum;
    }

    Cost agent(const Strings& printers) {
        Strings command = printers;
        command.insert(command.begin(), VENTRAS_AGENT);
        const auto cost = timedRun(command);
        const auto made = scheduler_.queues().size();
        if (made != printers.size())
            throw std::runtime_error("the agent made " + std::to_string(made) + " queues");
        deleteQueues();
        return cost;
    }

    void deleteQueues() const {
        for (const auto& queue : scheduler_.queues())
            scheduler_.deleteQueue(queue);
    }

    PrivateScheduler scheduler_;
    TemporaryFolder preferences_;
};

void measure(SpeedTable& table) {
    IppQueueBench bench;
    bench.onePrinter(table);
    bench.manyPrintersAtOnce(table);
    bench.manySlowPrinters(table);
    bench.oneSilentPrinter(table);
}

}  // namespace
}  // namespace ventras

int main() {
    return ventras::tabulate("ipp-queue-bench", ventras::measure);
}
