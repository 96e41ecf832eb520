#include <getopt.h>
#include <unistd.h>

#include <charconv>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <map>
#include <optional>
#include <random>
#include <string_view>

#include "tests/soak/Census.h"
#include "tests/soak/RoundPlan.h"
#include "tests/soak/RoundRun.h"
#include "tests/soak/Workshop.h"

// Runs the agent hundreds of times, against devices and faults that are drawn by lot, and looks after each
// round whether anything is left that should not be. What was drawn depends on the seed and the round's
// number alone.

namespace {

using namespace ventras;
using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr int kUsage = 2;

struct Options {
    int rounds = 300;
    int first = 0;
    std::uint64_t seed = std::random_device{}();
    std::chrono::seconds time = 1h;
};

template <class Number>
bool parse(std::string_view text, Number& number) {
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc{} && end == text.data() + text.size();
}

std::optional<Options> optionsFrom(int count, char** arguments) {
    constexpr option kOptions[] = {{"rounds", required_argument, nullptr, 'r'},
                                   {"first", required_argument, nullptr, 'f'},
                                   {"seed", required_argument, nullptr, 's'},
                                   {"seconds", required_argument, nullptr, 't'},
                                   {nullptr, 0, nullptr, 0}};
    Options options;
    std::int64_t seconds = options.time.count();
    bool isRight = true;
    for (int found = 0; (found = getopt_long(count, arguments, "", kOptions, nullptr)) != -1;)
        switch (found) {
            case 'r':
                isRight = isRight && parse(optarg, options.rounds);
                break;
            case 'f':
                isRight = isRight && parse(optarg, options.first);
                break;
            case 's':
                isRight = isRight && parse(optarg, options.seed);
                break;
            case 't':
                isRight = isRight && parse(optarg, seconds);
                break;
            default:
                isRight = false;
        }
    options.time = std::chrono::seconds(seconds);
    return isRight && optind == count ? std::optional{options} : std::nullopt;
}

/// Where the soak writes, while standard output belongs to the queue making that runs within it.
std::FILE* ownOutput() {
    static std::FILE* const output = [] {
        auto* own = fdopen(dup(STDOUT_FILENO), "w");
        std::setvbuf(own, nullptr, _IOLBF, 0);
        return std::freopen("/dev/null", "w", stdout) == nullptr ? stderr : own;
    }();
    return output;
}

class Soak {
public:
    explicit Soak(const Options& options) : options_(options) {}

    int run() {
        std::fprintf(ownOutput(), "seed %lu\n", static_cast<unsigned long>(options_.seed));
        const auto end = Clock::now() + options_.time;
        for (int round = options_.first; round < options_.first + options_.rounds && Clock::now() < end;
             ++round)
            if (!runRound(round))
                break;
        printTable();
        return failed_ ? 1 : 0;
    }

private:
    bool runRound(int round) {
        const auto plan = RoundPlan::draw(options_.seed, round);
        const auto before = Census::take();
        auto result = RoundRun(workshop_, plan, round).run();
        if (plan.place == Place::InProcess)
            checkCensus(before, result);
        ++rounds_;
        ++roundsByStatus_[result.status];
        if (result.objections.empty())
            std::fprintf(ownOutput(), "round %d: status %d (%s)\n", round, result.status,
                         plan.description().c_str());
        else
            report(round, plan, result);
        return result.objections.empty();
    }

    // Libraries keep some things for good from the first time on, like a connection to the system log.
    void checkCensus(const Census& before, RoundResult& result) {
        const auto after = Census::takeWhenAtMost(isWarm_ ? before : Census{});
        if (isWarm_ && after.exceeds(before))
            result.objections.push_back("more is in use than before the round: " + after.excessOver(before));
        isWarm_ = true;
    }

    void report(int round, const RoundPlan& plan, const RoundResult& result) {
        failed_ = true;
        std::fprintf(ownOutput(), "round %d FAILED (%s)\n", round, plan.description().c_str());
        for (const auto& objection : result.objections)
            std::fprintf(ownOutput(), "  %s\n", objection.c_str());
        std::fprintf(ownOutput(), "%s\nreplay: %s --seed %lu --first %d --rounds 1\n", result.story.c_str(),
                     program_invocation_name, static_cast<unsigned long>(options_.seed), round);
    }

    void printTable() const {
        std::fprintf(ownOutput(), "\nstatus  rounds\n");
        for (const auto& [status, rounds] : roundsByStatus_)
            std::fprintf(ownOutput(), "%6d  %6d\n", status, rounds);
        std::fprintf(ownOutput(), "%d rounds, seed %lu: %s\n", rounds_,
                     static_cast<unsigned long>(options_.seed), failed_ ? "FAILED" : "all well");
    }

    Options options_;
    Workshop workshop_;
    std::map<int, int> roundsByStatus_;
    int rounds_ = 0;
    bool isWarm_ = false;
    bool failed_ = false;
};

}  // namespace

int main(int count, char** arguments) {
    const auto options = optionsFrom(count, arguments);
    if (!options) {
        std::fprintf(stderr, "Usage: %s [--rounds N] [--seed N] [--first ROUND] [--seconds N]\n",
                     arguments[0]);
        return kUsage;
    }
    try {
        return Soak(*options).run();
    } catch (const std::exception& failure) {
        std::fprintf(ownOutput(), "the soak itself failed: %s\n", failure.what());
        return 1;
    }
}
