#include "ctl/SchedulerCheck.h"

#include "ctl/Complaint.h"
#include "ctl/Translation.h"
#include "platform/IppConnection.h"

namespace ventras {

std::optional<Exit> schedulerIsUnreachable() {
    const auto scheduler = IppConnection::toScheduler();
    if (scheduler.connected())
        return std::nullopt;
    complain(translated("the print scheduler does not answer: %@", scheduler.failure()));
    return Exit::Unreachable;
}

}  // namespace ventras
