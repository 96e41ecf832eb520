#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/VentrasController.h"
#include "drivers/PPDManager.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/queues/OwnTemporaryFiles.h"
#include "tests/queues/ScriptedScheduler.h"
#include "tests/usb/FakeUsbRegistry.h"

namespace ventras {

/// Whole rounds of the controller, on real workers and the real run loop: network printers are real IPP
/// responders, USB printers are attached to a registry in memory, the scheduler has no driver and the queues
/// that a test gives it, and the print system is in memory.
class Round : public testing::Test {
protected:
    using Arguments = std::vector<std::string>;

    /// Runs the controller as the agent's entry point does, up to its end.
    /// @return what run() gave.
    std::int32_t run(const Arguments& arguments) {
        testing::internal::CaptureStdout();
        testing::internal::CaptureStderr();
        const auto result = controller_.run(arguments);
        const auto limit = Deadline::after(std::chrono::seconds(60));
        while (result == 0 && !controller_.done() && !limit.passed())
            fake_.runLoop.runUntil(Deadline::after(std::chrono::seconds(1)));
        output_ = testing::internal::GetCapturedStdout();
        errors_ = testing::internal::GetCapturedStderr();
        EXPECT_EQ(controller_.done(), result == 0);
        return result;
    }

    /// Attaches a USB printer for which there is no driver. @return the argument that asks for it.
    std::string attach(std::uint32_t location, const std::string& model) {
        usb_.attach(location, {.deviceID = "MFG:Acme;MDL:" + model + ";CMD:GDI;SN:1;"});
        return "-u" + std::to_string(location) + ",0";
    }

    /// The ID under which software for such a printer is asked for.
    static std::string scanID(const std::string& model) { return "MANUFACTURER:Acme;MODEL:" + model; }

    /// The URI of such a printer.
    static std::string usbURI(const std::string& model) { return "usb://Acme/" + model + "?serial=1"; }

    /// Gives the scheduler a queue.
    void addQueue(const std::string& name, const std::string& uri) {
        const std::lock_guard lock(mutex_);
        queues_.emplace_back(name, uri);
    }

    /// Says how many driver packages the catalogue has for a printer.
    void offerPackages(const std::string& model, std::int64_t count) {
        fake_.printToolAgent.replies[scanID(model)] = {0, {{"count", count}}};
    }

    /// How often the log says that a device got no queue.
    std::ptrdiff_t failuresOf(const std::string& uri) const {
        const auto lines = fake_.log.lines();
        return std::ranges::count_if(
            lines, [&](const std::string& line) { return line.starts_with("No queue for " + uri + ":"); });
    }

    void TearDown() override { EXPECT_EQ(files_.left(), std::vector<std::string>{}); }

private:
    std::mutex mutex_;
    std::vector<std::pair<std::string, std::string>> queues_;

    void tellQueues(ipp_t* answer) {
        const std::lock_guard lock(mutex_);
        for (const auto& [name, uri] : queues_)
            ventras::addQueue(answer, name, uri);
    }

protected:
    OwnTemporaryFiles files_;
    ScriptedScheduler scheduler_{[this](ipp_t* answer) { tellQueues(answer); }};
    UseScheduler use_{scheduler_.address()};
    FakeUsbRegistry usb_;
    FakePlatform fake_{&usb_};
    PPDManager drivers_{fake_.platform};
    VentrasController controller_{fake_.platform, drivers_};
    std::string output_, errors_;
};

}  // namespace ventras
