#include "platform/linux/scheduler/CupsPrintSystem.h"

#include <sys/stat.h>

#include <array>

#include "platform/Log.h"
#include "platform/linux/PlistPreferenceStore.h"
#include "platform/linux/options/AutoSelect.h"
#include "platform/linux/ppd/PpdFile.h"
#include "platform/linux/scheduler/NewQueue.h"
#include "platform/linux/scheduler/Scheduler.h"

namespace ventras {
namespace {

// What the scheduler calls a queue without a driver, which hands documents on as they are.
constexpr std::string_view kRawQueue = "Local Raw Printer";

Refusal cannotCreate(std::string reason) {
    return {PrintSystemStatus::kCannotCreate, std::move(reason)};
}

// The scheduler hides a password in a device URI from its answers.
bool isSameDevice(const std::string& ordered, const std::string& made) {
    return ordered == made || ordered.find('@') != std::string::npos;
}

std::optional<Refusal> objectionToResult(const NewQueue& ordered, const QueueState& made) {
    if (made.makeAndModel.empty() || made.makeAndModel.starts_with(kRawQueue))
        return cannotCreate("the scheduler made a queue without a driver");
    if (made.state == IPP_PSTATE_STOPPED || !made.accepting)
        return cannotCreate("the new queue does not take jobs");
    if (!isSameDevice(ordered.deviceURI, made.deviceURI))
        return cannotCreate("the new queue has another device: " + made.deviceURI);
    return std::nullopt;
}

std::string queueText(const std::string& queueID) {
    return "queue \"" + queueID + "\"";
}

}  // namespace

std::int32_t CupsPrintSystem::report(const std::string& what, const Refusal& refusal) {
    log_.error(what + ": " + refusal.reason);
    return refusal.status;
}

std::optional<std::string> CupsPrintSystem::suggestQueueName(const std::string& name, bool unique) {
    const auto plain = queueNameFrom(name);
    if (plain.empty())
        return std::nullopt;
    if (!unique)
        return plain;
    const auto names = Scheduler().queueNames();
    if (const auto* refusal = std::get_if<Refusal>(&names)) {
        report("no name for a queue like \"" + name + "\"", *refusal);
        return std::nullopt;
    }
    return uniqueQueueName(plain, std::get<QueueNames>(names));
}

std::optional<std::string> CupsPrintSystem::copyLocalServerURL() {
    std::array<char, HTTP_MAX_URI> url{};
    const auto status = httpAssembleURI(HTTP_URI_CODING_ALL, url.data(), static_cast<int>(url.size()), "ipp",
                                        nullptr, cupsServer(), ippPort(), "/");
    return status == HTTP_URI_STATUS_OK ? std::optional<std::string>(url.data()) : std::nullopt;
}

std::int32_t CupsPrintSystem::createQueue(const std::string& serverURL, const std::string& queueID,
                                          const std::string& attributes,
                                          const std::map<std::string, std::string>& options) {
    const auto what = queueText(queueID) + " is not made";
    if (serverURL != copyLocalServerURL())
        return report(what, {PrintSystemStatus::kBadData, "the print server " + serverURL + " is not ours"});
    const auto parsed = NewQueue::parse(queueID, attributes, options);
    if (const auto* refusal = std::get_if<Refusal>(&parsed))
        return report(what, *refusal);
    const auto& queue = std::get<NewQueue>(parsed);
    const auto refusal = create(queue);
    return refusal ? report(what + " for " + queue.deviceURI, *refusal) : PrintSystemStatus::kSuccess;
}

std::optional<Refusal> CupsPrintSystem::create(const NewQueue& queue) {
    const auto ppd = PpdFile::open(queue.ppdPath);
    if (auto objection = objectionToDriver(ppd, queue.driverKind))
        return Refusal{PrintSystemStatus::kBadData, std::move(*objection)};

    Scheduler scheduler;
    // The one request that makes a queue would change an existing one.
    const auto existing = scheduler.queueState(queue.queueID);
    if (const auto* refusal = std::get_if<Refusal>(&existing))
        return *refusal;
    if (std::get<std::optional<QueueState>>(existing))
        return cannotCreate("a queue of this name exists");

    rememberLeftover(queue.queueID);
    auto refusal = createUnchecked(scheduler, queue, ppd);
    // A queue that does not work is worse than none; if the scheduler keeps it now, removeQueue() tries
    // again.
    if (!refusal || !scheduler.deleteQueue(queue.queueID))
        forgetLeftover(queue.queueID);
    return refusal;
}

std::optional<Refusal> CupsPrintSystem::createUnchecked(Scheduler& scheduler, const NewQueue& queue,
                                                        const PpdFile& ppd) {
    if (auto refusal = scheduler.addQueue(queue, ppd.descriptor()))
        return refusal;
    const auto made = scheduler.queueState(queue.queueID);
    if (const auto* refusal = std::get_if<Refusal>(&made))
        return *refusal;
    const auto& state = std::get<std::optional<QueueState>>(made);
    if (!state)
        return cannotCreate("the scheduler lost the new queue");
    if (auto refusal = objectionToResult(queue, *state))
        return refusal;
    rememberOwn(queue.queueID, {state->isFax(), ppd.isScannerOnly()});
    return std::nullopt;
}

std::optional<CupsPrintSystem::QueueKind> CupsPrintSystem::kindOfOwn(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    const auto own = made_.find(queueID);
    return own == made_.end() ? std::nullopt : std::optional{own->second};
}

void CupsPrintSystem::rememberOwn(const std::string& queueID, QueueKind kind) {
    const std::lock_guard lock(mutex_);
    made_.insert_or_assign(queueID, kind);
}

void CupsPrintSystem::forgetOwn(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    made_.erase(queueID);
}

void CupsPrintSystem::rememberLeftover(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    leftovers_.insert(queueID);
}

bool CupsPrintSystem::isLeftover(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    return leftovers_.contains(queueID);
}

void CupsPrintSystem::forgetLeftover(const std::string& queueID) {
    const std::lock_guard lock(mutex_);
    leftovers_.erase(queueID);
}

std::int32_t CupsPrintSystem::removeQueue(const std::string& queueID) {
    // No line in the log: after most failures there is nothing left to remove, and the failure has its line.
    if (!isLeftover(queueID))
        return PrintSystemStatus::kNoPermission;
    if (const auto refusal = Scheduler().deleteQueue(queueID))
        return report(queueText(queueID) + " is not removed", *refusal);
    forgetLeftover(queueID);
    return PrintSystemStatus::kSuccess;
}

std::int32_t CupsPrintSystem::setDefaultPrinter(const std::string& queueID) {
    const auto refusal = Scheduler().setDefaultQueue(queueID);
    return refusal ? report(queueText(queueID) + " does not become the default", *refusal)
                   : PrintSystemStatus::kSuccess;
}

bool CupsPrintSystem::isFax(const std::string& queueID) {
    if (const auto own = kindOfOwn(queueID))
        return own->isFax;
    const auto state = Scheduler().queueState(queueID);
    if (const auto* refusal = std::get_if<Refusal>(&state)) {
        report(queueText(queueID) + " does not tell whether it is a fax", *refusal);
        return false;
    }
    const auto& found = std::get<std::optional<QueueState>>(state);
    return found && found->isFax();
}

bool CupsPrintSystem::isScanner(const std::string& queueID) {
    if (const auto own = kindOfOwn(queueID))
        return own->isScanner;
    const auto ppd = Scheduler().fetchPPD(queueID);
    if (const auto* refusal = std::get_if<Refusal>(&ppd)) {
        report(queueText(queueID) + " does not tell whether it is a scanner", *refusal);
        return false;
    }
    return PpdFile::open(std::get<TemporaryFile>(ppd).path()).isScannerOnly();
}

std::optional<std::string> CupsPrintSystem::copyQueuePPD(const std::string& queueID) {
    auto ppd = Scheduler().fetchPPD(queueID);
    if (const auto* refusal = std::get_if<Refusal>(&ppd)) {
        report(queueText(queueID) + " does not hand out its PPD", *refusal);
        return std::nullopt;
    }
    return std::get<TemporaryFile>(ppd).release();
}

std::int32_t CupsPrintSystem::setQueuePPD(const std::string& queueID, const std::string& ppdPath) {
    const auto what = queueText(queueID) + " keeps its driver";
    Scheduler scheduler;
    const auto fetched = scheduler.fetchPPD(queueID);
    if (const auto* refusal = std::get_if<Refusal>(&fetched))
        return report(what, *refusal);
    const auto present = PpdFile::open(std::get<TemporaryFile>(fetched).path());
    const auto replacement = PpdFile::open(ppdPath);
    if (auto objection = objectionToReplacement(present, replacement))
        return report(what, {PrintSystemStatus::kBadData, std::move(*objection)});
    forgetOwn(queueID);
    const auto refusal = scheduler.replacePPD(queueID, replacement.descriptor());
    return refusal ? report(what, *refusal) : PrintSystemStatus::kSuccess;
}

std::optional<std::string> CupsPrintSystem::copyLocalizedPPD(const std::string& ppdPath) {
    // PPDs of this print system hold all their languages in one file.
    struct stat status {};
    if (stat(ppdPath.c_str(), &status) != 0 || !S_ISREG(status.st_mode))
        return std::nullopt;
    return ppdPath;
}

bool CupsPrintSystem::useLastPrinterAsCurrentPrinter() {
    const auto wish = preferences_.value(kPreferenceDomain, kNewestIsDefault);
    if (const auto* flag = wish ? std::get_if<bool>(&*wish) : nullptr; flag != nullptr && *flag)
        return true;
    const auto hasDefault = Scheduler().hasDefaultQueue();
    if (const auto* refusal = std::get_if<Refusal>(&hasDefault)) {
        report("the default printer cannot be told", *refusal);
        return false;
    }
    return !std::get<bool>(hasDefault);
}

AutoSelectCreation CupsPrintSystem::autoSelectCreateContext(const std::string& deviceURI) {
    return {PrintSystemStatus::kSuccess, makeAutoSelectContext(deviceURI, log_)};
}

}  // namespace ventras
