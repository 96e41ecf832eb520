#pragma once

#include <gtest/gtest.h>

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "drivers/PPDManager.h"
#include "queues/QueueMaker.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/PrivateScheduler.h"
#include "tests/queues/OwnTemporaryFiles.h"
#include "tests/queues/ScriptedScheduler.h"

namespace ventras {

/// A computer whose scheduler has the queues that `existing_` names, and whose print system is in memory.
/// Fails when a temporary file, or a context of option selection, is left behind.
class QueueMaking : public testing::Test {
protected:
    /// Makes the queue of a device; `output_` is what was printed meanwhile.
    std::int32_t makeFor(VentrasPrinterObject& device) {
        testing::internal::CaptureStdout();
        const auto status = maker_.createQueueForDevice(device);
        output_ = testing::internal::GetCapturedStdout();
        return status;
    }

    /// Adds the scheduler's own answers, e.g. its drivers; the queues come by themselves.
    virtual void answer(ipp_t* answer) {
        for (const auto& [name, uri] : existing_)
            addQueue(answer, name, std::string(uri));
    }

    void TearDown() override {
        EXPECT_EQ(files_.left(), std::vector<std::string>{});
        EXPECT_EQ(printSystem_.contextsAlive, 0);
    }

    TemporaryFolder folder_;  // for what a test itself puts down; not where temporary files go
    OwnTemporaryFiles files_;
    std::vector<std::pair<const char*, std::string_view>> existing_;
    ScriptedScheduler scheduler_{[this](ipp_t* response) { answer(response); }};
    UseScheduler use_{scheduler_.address()};
    FakePlatform fake_;
    FakePrintSystem& printSystem_ = fake_.printSystem;
    PPDManager drivers_{fake_.platform};
    QueueMaker maker_{fake_.platform, drivers_};
    std::string output_;
};

}  // namespace ventras
