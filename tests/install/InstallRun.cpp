#include "tests/install/InstallRun.h"

#include "download/DownloadTriggerOperation.h"
#include "platform/Deadline.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

class PersonPrompter : public Prompter {
public:
    explicit PersonPrompter(Person& person) : person_(person) {}

    PromptAnswer ask(const InstallQuestion& question, Deadline) override {
        person_.questions.push_back(question);
        if (person_.whileThinking)
            person_.whileThinking();
        return person_.answer;
    }
    void showProgress(const std::string& text, std::optional<std::uint32_t> percent) override {
        person_.progress.push_back(percent ? text + " " + std::to_string(*percent) : text);
    }
    void finish(const std::string& title, const std::string& message) override {
        person_.lastWords.push_back(title + "|" + message);
    }

private:
    Person& person_;
};

}  // namespace

std::unique_ptr<Prompter> Person::prompter() {
    return std::make_unique<PersonPrompter>(*this);
}

InstallLimits shortLimits() {
    const TransactionLimits limits{.answer = 1s, .silence = 600ms, .total = 1800ms};
    return {.packageKit = {.connect = 500ms, .lookUp = limits, .change = limits}, .prompt = 300ms};
}

InstallRun::InstallRun(std::filesystem::path catalogue, Person* person, InstallLimits limits) {
    LinuxPredicateInstallController::Parts parts;
    parts.catalogue = std::move(catalogue);
    parts.limits = std::make_shared<const InstallLimits>(limits);
    if (person != nullptr)
        parts.makePrompter = [person](EventContext&) { return person->prompter(); };
    controller_.emplace(log_, strings_, std::move(parts));
    controller_->setDelegate(this);
}

void InstallRun::start(const std::vector<std::string>& scanIDs) {
    controller_->setInstalledPrintersList(
        {{"InstalledPrinters", PropertyArray(scanIDs.begin(), scanIDs.end())}});
    startPredicate(DownloadTriggerOperation::predicateForUpdateStrings(scanIDs).value());
}

void InstallRun::startPredicate(const std::string& predicate) {
    controller_->configure(settings);
    controller_->setTitle("Would you like to download and install software for 'Laser'?");
    controller_->startWithPredicate(predicate, confirmsCompletion);
    if (!ends_.empty())
        add("too early");
}

std::string InstallRun::end(std::chrono::milliseconds limit) {
    runLoop_.runUntil(Deadline::after(limit));
    const auto ends = std::exchange(ends_, "");
    return ends.empty() ? "nothing" : ends;
}

std::string InstallRun::install(const std::vector<std::string>& scanIDs) {
    start(scanIDs);
    return end();
}

std::string InstallRun::installPredicate(const std::string& predicate) {
    startPredicate(predicate);
    return end();
}

void InstallRun::add(const std::string& end) {
    ends_ += ends_.empty() ? "" : ", ";
    ends_ += std::this_thread::get_id() == mainThread_ ? end : end + " on a wrong thread";
    runLoop_.stop();
}

}  // namespace ventras
