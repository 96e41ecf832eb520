#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "platform/PredicateInstallController.h"
#include "platform/RunLoop.h"
#include "platform/linux/installer/LinuxPredicateInstallController.h"
#include "platform/linux/installer/PackageInstaller.h"
#include "tests/fakes/FakePlatform.h"

namespace ventras {

/// A person who was asked, and what they were shown. Any thread may look when the install is over.
struct Person {
    PromptAnswer answer = PromptAnswer::Yes;
    std::function<void()> whileThinking{};
    std::vector<InstallQuestion> questions{};
    std::vector<std::string> progress{};
    std::vector<std::string> lastWords{};

    /// A way to talk to them.
    std::unique_ptr<Prompter> prompter();
};

/// Time limits for tests that wait for them.
InstallLimits shortLimits();

/// The installer of the platform, with a catalogue and perhaps a person of the test's. The system bus is that
/// of the environment. Main thread only.
class InstallRun : private PredicateInstallDelegate {
public:
    /// @param person outlives it; null = whom the installer finds by itself
    explicit InstallRun(std::filesystem::path catalogue, Person* person = nullptr,
                        InstallLimits limits = InstallLimits{});
    InstallRun(const InstallRun&) = delete;
    InstallRun& operator=(const InstallRun&) = delete;

    /// Starts an install for devices, by the predicate that asks for their software.
    void start(const std::vector<std::string>& scanIDs);
    void startPredicate(const std::string& predicate);

    /// Turns the run loop until it ends.
    /// @return how: "completed", "cancelled", "failed 101"; several, with ", " between, when it told more
    /// than
    ///         once; "nothing" when it does not end in time.
    std::string end(std::chrono::milliseconds limit = std::chrono::seconds(20));

    /// The same, from the beginning.
    std::string install(const std::vector<std::string>& scanIDs);
    std::string installPredicate(const std::string& predicate);

    /// Ends the installer itself.
    void destroy() { controller_.reset(); }

    const FakeLog& log() const { return log_; }

    PredicateInstallSettings settings{};
    bool confirmsCompletion = false;

private:
    void predicateInstallDidComplete() override { add("completed"); }
    void predicateInstallUserDidCancel() override { add("cancelled"); }
    void predicateInstallDidFailWithError(std::int64_t code) override {
        add("failed " + std::to_string(code));
    }
    void add(const std::string& end);

    RunLoop runLoop_;
    FakeLog log_;
    FakeStrings strings_;
    std::thread::id mainThread_ = std::this_thread::get_id();
    std::string ends_;
    std::optional<LinuxPredicateInstallController> controller_;
};

}  // namespace ventras
