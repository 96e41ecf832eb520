#include "tests/parts/PostScriptInterpreter.h"

#include <condition_variable>
#include <deque>
#include <mutex>
#include <stop_token>
#include <thread>
#include <utility>

#include "tests/parts/Program.h"

namespace ventras {
namespace {

constexpr char kEndOfJob = '\x04';
constexpr std::string_view kUniversalExit = "\x1b%-12345X";
constexpr std::string_view kPjl = "@PJL";

std::string withoutPjl(std::string job) {
    for (auto at = job.find(kUniversalExit); at != std::string::npos; at = job.find(kUniversalExit, at)) {
        job.erase(at, kUniversalExit.size());
        while (job.compare(at, kPjl.size(), kPjl) == 0)
            job.erase(at, job.find('\n', at) - at + 1);
    }
    return job;
}

}  // namespace

class PostScriptInterpreter::Worker {
public:
    Worker(std::string prologue, bool hasPjl) : prologue_(std::move(prologue)), hasPjl_(hasPjl) {}

    void take(std::string job) {
        const std::lock_guard lock(mutex_);
        jobs_.push_back(std::move(job));
        changed_.notify_one();
    }

    std::string printed() {
        const std::lock_guard lock(mutex_);
        return std::exchange(printed_, {});
    }

private:
    void work(const std::stop_token& stop) {
        std::unique_lock lock(mutex_);
        while (changed_.wait(lock, stop, [this] { return !jobs_.empty(); })) {
            auto job = std::move(jobs_.front());
            jobs_.pop_front();
            lock.unlock();
            auto output = run(std::move(job));
            lock.lock();
            printed_ += output;
        }
    }

    std::string run(std::string job) const {
        const ProgramOptions options{
            .environment = {{"LD_PRELOAD", ""}},
            .standardInput = prologue_ + "\n" + (hasPjl_ ? withoutPjl(std::move(job)) : job)};
        return runProgram({"gs", "-q", "-dNODISPLAY", "-dNOPROMPT", "-dBATCH", "-dSAFER", "-"}, options)
            .standardOutput;
    }

    std::string prologue_;
    bool hasPjl_;
    std::mutex mutex_;
    std::condition_variable_any changed_;
    std::deque<std::string> jobs_;
    std::string printed_;
    std::jthread thread_{[this](const std::stop_token& stop) { work(stop); }};
};

PostScriptInterpreter::PostScriptInterpreter(std::string prologue, bool hasPjl)
    : worker_(std::make_shared<Worker>(std::move(prologue), hasPjl)) {}

std::string PostScriptInterpreter::operator()(std::string_view data) {
    pending_ += data;
    for (auto end = pending_.find(kEndOfJob); end != std::string::npos; end = pending_.find(kEndOfJob)) {
        worker_->take(pending_.substr(0, end));
        pending_.erase(0, end + 1);
    }
    return worker_->printed();
}

}  // namespace ventras
