#include "ctl/QueueCommand.h"

#include <array>

#include "ctl/Complaint.h"
#include "ctl/LineByLine.h"
#include "ctl/Output.h"
#include "ctl/SchedulerCheck.h"
#include "ctl/Services.h"
#include "ctl/Translation.h"
#include "queues/QueueInventory.h"
#include "queues/QueueNaming.h"

namespace ventras {
namespace {

Object namesFor(const std::string& name, bool strips, PrintSystemService* printSystem) {
    const auto stripped = stripBracketedTag(name);
    std::optional<std::string> queueName, displayName;
    if (printSystem != nullptr) {
        displayName = suggestedDisplayName(*printSystem, strips ? stripped : name);
        queueName = printSystem->suggestQueueName(*displayName, true);
    }
    return {{"stripped", stripped}, {"queueName", queueName}, {"displayName", displayName}};
}

}  // namespace

Exit showQueues(const Arguments& arguments, Output& output) {
    if (!arguments.operands.empty())
        return usageError(translated("queues: takes no operand"));
    Services services;
    const auto queues = QueueInventory(services.platform()).existingQueues();
    if (const auto unreachable = queues ? std::nullopt : schedulerIsUnreachable())
        return *unreachable;
    Array rows;
    for (const auto& queue : queues.value_or(QueueRecords{}))
        rows.push_back(Object{{"printer-name", queue.printerName},
                              {"device-uri", queue.deviceURI},
                              {"printer-type", queue.printerType}});
    output.print(rows, std::array{Column{"printer-name", translatable("QUEUE")},
                                  Column{"device-uri", translatable("DEVICE")}});
    return Exit::Success;
}

Exit showNames(const Arguments& arguments, Output& output) {
    if (arguments.operands.size() != 1)
        return usageError(translated("name: which name?"));
    Services services;
    auto* printSystem = schedulerIsUnreachable() ? nullptr : &services.printSystem();
    const auto answer = [&](const std::string& name) {
        return namesFor(name, arguments.has("strip"), printSystem);
    };

    if (arguments.areFromStandardInput())
        return answerLines(output,
                           [&](const std::string& line) { return std::optional<Value>{answer(line)}; });
    output.print(answer(arguments.operands.front()));
    return Exit::Success;
}

}  // namespace ventras
