#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"
#include "ctl/Translation.h"

namespace ventras {

class Output;

inline constexpr Option kNameOptions[] = {
    {"strip", nullptr,
     translatable("make the queue's names of the name without its tag in brackets, as for a device")},
};

/// The queues that the agent takes into account.
Exit showQueues(const Arguments& arguments, Output& output);

/// What a device's name becomes.
Exit showNames(const Arguments& arguments, Output& output);

}  // namespace ventras
