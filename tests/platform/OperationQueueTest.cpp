#include "platform/OperationQueue.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <functional>
#include <latch>
#include <semaphore>

#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

class Work final : public Operation {
public:
    explicit Work(std::function<void()> function) : function_(std::move(function)) {}
    void main() override { function_(); }

private:
    std::function<void()> function_;
};

std::shared_ptr<Work> work(std::function<void()> function) {
    return std::make_shared<Work>(std::move(function));
}

TEST(OperationQueue, RunsAnOperationOnceOnAnotherThread) {
    std::atomic<int> runs = 0;
    std::thread::id ranOn;
    std::latch done(1);
    OperationQueue queue;
    queue.addOperation(work([&] {
        ++runs;
        ranOn = std::this_thread::get_id();
        done.count_down();
    }));
    done.wait();
    std::this_thread::sleep_for(20ms);
    EXPECT_EQ(runs, 1);
    EXPECT_NE(ranOn, std::this_thread::get_id());
}

TEST(OperationQueue, RunsWaitingOperationsSideBySide) {
    constexpr int kOperations = 50;
    std::latch done(kOperations);
    OperationQueue queue;
    const auto begin = Clock::now();
    for (int i = 0; i < kOperations; ++i)
        queue.addOperation(work([&] {
            std::this_thread::sleep_for(200ms);
            done.count_down();
        }));
    done.wait();
    EXPECT_LT(Clock::now() - begin, 2s) << "one after the other takes 10 s";
}

TEST(OperationQueue, NeverHasMoreWorkersThanItSays) {
    constexpr int kOperations = 200;
    std::atomic<int> running = 0;
    std::atomic<int> most = 0;
    std::latch done(kOperations);
    OperationQueue queue;
    for (int i = 0; i < kOperations; ++i)
        queue.addOperation(work([&] {
            const int now = ++running;
            for (int seen = most; now > seen && !most.compare_exchange_weak(seen, now);) {
            }
            std::this_thread::sleep_for(10ms);
            --running;
            done.count_down();
        }));
    done.wait();
    EXPECT_LE(most, static_cast<int>(OperationQueue::kMostWorkers));
    EXPECT_GT(most, 32) << "the width should have been used";
}

TEST(OperationQueue, StartsReadyOperationsInTheOrderOfTheirArrival) {
    // One worker is enough for this order to show: each operation waits for the one before.
    std::vector<int> order;
    std::latch done(1);
    OperationQueue queue;
    std::shared_ptr<Operation> previous;
    for (int i = 0; i < 100; ++i) {
        const auto operation = work([&order, &done, i] {
            order.push_back(i);
            if (i == 99)
                done.count_down();
        });
        if (previous)
            operation->addDependency(previous);
        queue.addOperation(operation);
        previous = operation;
    }
    done.wait();
    EXPECT_EQ(order.size(), 100U);
    EXPECT_TRUE(std::ranges::is_sorted(order));
}

TEST(OperationQueue, HoldsAnOperationUntilAllItsDependenciesHaveFinished) {
    std::atomic<int> finished = 0;
    int finishedBefore = -1;
    std::latch done(1);
    const auto last = work([&] {
        finishedBefore = finished;
        done.count_down();
    });
    OperationQueue queue;
    for (int i = 0; i < 100; ++i) {
        const auto operation = work([&finished, i] {
            std::this_thread::sleep_for(std::chrono::milliseconds(i % 7));
            ++finished;
        });
        last->addDependency(operation);
        queue.addOperation(operation);
    }
    queue.addOperation(last);
    done.wait();
    EXPECT_EQ(finishedBefore, 100);
}

TEST(OperationQueue, TakesADependentBeforeItsDependency) {
    std::vector<std::string> order;
    std::latch done(1);
    const auto first = work([&] { order.emplace_back("first"); });
    const auto second = work([&] {
        order.emplace_back("second");
        done.count_down();
    });
    second->addDependency(first);
    OperationQueue queue;
    queue.addOperation(second);
    std::this_thread::sleep_for(20ms);
    queue.addOperation(first);
    done.wait();
    EXPECT_EQ(order, (std::vector<std::string>{"first", "second"}));
}

TEST(OperationQueue, KnowsADependencyThatFinishedLongAgo) {
    std::latch firstDone(1);
    std::latch secondDone(1);
    const auto first = work([&] { firstDone.count_down(); });
    const auto second = work([&] { secondDone.count_down(); });
    OperationQueue queue;
    queue.addOperation(first);
    firstDone.wait();
    std::this_thread::sleep_for(20ms);
    second->addDependency(first);
    queue.addOperation(second);
    secondDone.wait();
}

TEST(OperationQueue, LetsOperationsAddOperations) {
    std::latch done(1);
    OperationQueue queue;
    queue.addOperation(work([&] { queue.addOperation(work([&] { done.count_down(); })); }));
    done.wait();
}

TEST(OperationQueue, ReleasesAnOperationThatHasFinished) {
    std::weak_ptr<Operation> watched;
    std::latch done(1);
    OperationQueue queue;
    {
        const auto operation = work([] {});
        watched = operation;
        queue.addOperation(operation);
    }
    queue.addOperation(work([&] { done.count_down(); }));
    done.wait();
    EXPECT_TRUE(comesTrue([&] { return watched.expired(); }, 5s));
}

TEST(OperationQueue, EndsWithTheOperationsThatAreRunning) {
    std::atomic<bool> finished = false;
    std::binary_semaphore begun(0);
    {
        OperationQueue queue;
        queue.addOperation(work([&] {
            begun.release();
            std::this_thread::sleep_for(100ms);
            finished = true;
        }));
        begun.acquire();
    }
    EXPECT_TRUE(finished);
}

TEST(OperationQueue, DropsWhatHasNotBegunWhenItEnds) {
    std::atomic<bool> ran = false;
    std::binary_semaphore begun(0);
    {
        OperationQueue queue;
        const auto slow = work([&] {
            begun.release();
            std::this_thread::sleep_for(100ms);
        });
        const auto waiting = work([&] { ran = true; });
        waiting->addDependency(slow);
        queue.addOperation(slow);
        queue.addOperation(waiting);
        begun.acquire();
    }
    EXPECT_FALSE(ran);
}

TEST(OperationQueue, EndsWellWhenARunningOperationAddsMore) {
    for (int round = 0; round < 50; ++round) {
        std::vector<std::weak_ptr<Operation>> added;
        std::binary_semaphore begun(0);
        {
            OperationQueue queue;
            queue.addOperation(work([&] {
                begun.release();
                std::this_thread::sleep_for(2ms);  // so that most often the end has begun
                for (int i = 0; i < 20; ++i) {
                    const auto operation = work([] {});
                    added.push_back(operation);
                    queue.addOperation(operation);
                }
            }));
            begun.acquire();
        }
        // Each has run or was dropped; none is left in a queue that is gone.
        EXPECT_EQ(added.size(), 20U) << round;
        EXPECT_TRUE(std::ranges::all_of(added, [](const auto& operation) { return operation.expired(); }))
            << round;
    }
}

TEST(OperationQueue, EndsWithoutEverHavingWorked) {
    const OperationQueue queue;
}

TEST(OperationQueue, RunsThousandsOfOperations) {
    constexpr int kOperations = 5000;
    std::atomic<int> runs = 0;
    std::latch done(1);
    OperationQueue queue;
    const auto last = work([&] { done.count_down(); });
    for (int i = 0; i < kOperations; ++i) {
        const auto operation = work([&] { ++runs; });
        last->addDependency(operation);
        queue.addOperation(operation);
    }
    queue.addOperation(last);
    done.wait();
    EXPECT_EQ(runs, kOperations);
}

}  // namespace
}  // namespace ventras
