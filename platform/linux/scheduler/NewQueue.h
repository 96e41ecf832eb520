#pragma once

#include <map>
#include <string>
#include <variant>

#include "platform/linux/ppd/DriverRules.h"
#include "platform/linux/scheduler/SchedulerRequest.h"

namespace ventras {

/// A queue to be made, its settings checked: nothing in it holds a control character or broken UTF-8.
struct NewQueue {
    std::string queueID;
    std::string deviceURI;
    std::string ppdPath;
    std::string location;     ///< at most kLongestQueueText bytes; may be empty
    std::string displayName;  ///< the same
    DriverKind driverKind = DriverKind::Driverless;

    /// Reads the settings.
    /// @param attributes QueueAttributes as an XML property list
    /// @param options by QueueOptionKeys
    static std::variant<NewQueue, Refusal> parse(const std::string& queueID, const std::string& attributes,
                                                 const std::map<std::string, std::string>& options);
};

}  // namespace ventras
