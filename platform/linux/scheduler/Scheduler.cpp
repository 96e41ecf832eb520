#include "platform/linux/scheduler/Scheduler.h"

#include <array>
#include <string_view>

namespace ventras {
namespace {

constexpr auto kAdministration = "/admin/";
constexpr auto kEverything = "/";

template <std::size_t Count>
void request(ipp_t* message, const std::array<const char*, Count>& attributes) {
    ippAddStrings(message, IPP_TAG_OPERATION, IPP_TAG_KEYWORD, "requested-attributes",
                  static_cast<int>(Count), nullptr, attributes.data());
}

std::string textOf(ipp_t* message, const char* name) {
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_ZERO);
    const char* text = attribute == nullptr ? nullptr : ippGetString(attribute, 0, nullptr);
    return text == nullptr ? std::string() : std::string(text);
}

int numberOf(ipp_t* message, const char* name, int otherwise) {
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_ENUM);
    return attribute == nullptr ? otherwise : ippGetInteger(attribute, 0);
}

bool flagOf(ipp_t* message, const char* name) {
    auto* attribute = ippFindAttribute(message, name, IPP_TAG_BOOLEAN);
    return attribute != nullptr && ippGetBoolean(attribute, 0) != 0;
}

void addText(ipp_t* message, const char* name, const std::string& text) {
    if (!text.empty())
        ippAddString(message, IPP_TAG_PRINTER, IPP_TAG_TEXT, name, nullptr, text.c_str());
}

}  // namespace

std::variant<QueueNames, Refusal> Scheduler::queueNames() {
    auto question = schedulerRequest(IPP_OP_CUPS_GET_PRINTERS);
    request(question.get(), std::array{"printer-name"});
    const auto answer = connection_.exchange(std::move(question), kEverything);
    if (answer.status == IPP_STATUS_ERROR_NOT_FOUND && answer.response)
        return QueueNames{};  // how the scheduler says that it has no destinations
    if (auto refusal = refusalIn(answer))
        return *refusal;

    QueueNames names;
    for (auto* attribute = ippFindAttribute(answer.response.get(), "printer-name", IPP_TAG_NAME);
         attribute != nullptr;
         attribute = ippFindNextAttribute(answer.response.get(), "printer-name", IPP_TAG_NAME))
        if (const char* name = ippGetString(attribute, 0, nullptr))
            names.insert(name);
    return names;
}

std::variant<std::optional<QueueState>, Refusal> Scheduler::queueState(const std::string& queueID) {
    auto question = queueRequest(IPP_OP_GET_PRINTER_ATTRIBUTES, queueID);
    request(question.get(), std::array{"device-uri", "printer-is-accepting-jobs", "printer-make-and-model",
                                       "printer-state", "printer-type"});
    const auto answer = connection_.exchange(std::move(question), kEverything);
    if (answer.status == IPP_STATUS_ERROR_NOT_FOUND)
        return std::nullopt;
    if (auto refusal = refusalIn(answer))
        return *refusal;

    auto* response = answer.response.get();
    return QueueState{
        .deviceURI = textOf(response, "device-uri"),
        .makeAndModel = textOf(response, "printer-make-and-model"),
        .type = static_cast<std::uint32_t>(numberOf(response, "printer-type", 0)),
        .state = static_cast<ipp_pstate_t>(numberOf(response, "printer-state", IPP_PSTATE_STOPPED)),
        .accepting = flagOf(response, "printer-is-accepting-jobs")};
}

std::optional<Refusal> Scheduler::addQueue(const NewQueue& queue, int ppd) {
    auto order = queueRequest(IPP_OP_CUPS_ADD_MODIFY_PRINTER, queue.queueID);
    ippAddString(order.get(), IPP_TAG_PRINTER, IPP_TAG_URI, "device-uri", nullptr, queue.deviceURI.c_str());
    addText(order.get(), "printer-info", queue.displayName);
    addText(order.get(), "printer-location", queue.location);
    // Without these two a new queue is stopped and rejects jobs. A port monitor is refused along with a new
    // PPD.
    ippAddBoolean(order.get(), IPP_TAG_PRINTER, "printer-is-accepting-jobs", 1);
    ippAddInteger(order.get(), IPP_TAG_PRINTER, IPP_TAG_ENUM, "printer-state", IPP_PSTATE_IDLE);
    return refusalIn(connection_.exchange(std::move(order), kAdministration, ppd));
}

std::optional<Refusal> Scheduler::replacePPD(const std::string& queueID, int ppd) {
    return refusalIn(
        connection_.exchange(queueRequest(IPP_OP_CUPS_ADD_MODIFY_PRINTER, queueID), kAdministration, ppd));
}

std::optional<Refusal> Scheduler::deleteQueue(const std::string& queueID) {
    const auto answer =
        connection_.exchange(queueRequest(IPP_OP_CUPS_DELETE_PRINTER, queueID), kAdministration);
    return answer.status == IPP_STATUS_ERROR_NOT_FOUND ? std::nullopt : refusalIn(answer);
}

std::optional<Refusal> Scheduler::setDefaultQueue(const std::string& queueID) {
    return refusalIn(connection_.exchange(queueRequest(IPP_OP_CUPS_SET_DEFAULT, queueID), kAdministration));
}

std::variant<TemporaryFile, Refusal> Scheduler::fetchPPD(const std::string& queueID) {
    auto file = TemporaryFile::create();
    if (!file)
        return Refusal{PrintSystemStatus::kUnavailable, "no temporary file can be made"};
    const auto answer =
        connection_.exchange(queueRequest(IPP_OP_CUPS_GET_PPD, queueID), kEverything, -1, file->descriptor());
    if (auto refusal = refusalIn(answer))
        return *refusal;
    file->close();
    return std::move(*file);
}

std::variant<bool, Refusal> Scheduler::hasDefaultQueue() {
    auto question = schedulerRequest(IPP_OP_CUPS_GET_DEFAULT);
    request(question.get(), std::array{"printer-name"});
    const auto answer = connection_.exchange(std::move(question), kEverything);
    if (answer.status == IPP_STATUS_ERROR_NOT_FOUND)
        return false;
    if (auto refusal = refusalIn(answer))
        return *refusal;
    return true;
}

}  // namespace ventras
