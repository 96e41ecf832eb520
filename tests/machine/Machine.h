#pragma once

#include <map>
#include <string>
#include <vector>

namespace ventras {

/// The computer that the tests run on, asked as a person would ask it. Any thread may call.
namespace Machine {

/// The scheduler's queues: their names and device URIs.
std::map<std::string, std::string> queues();

/// The queue of a device; empty when there is none.
std::string queueOf(const std::string& deviceURI);

/// What the agent and its services have written into the journal since the machine booted.
std::string journal();

/// How many lines of that hold a text.
long timesInJournal(const std::string& text);

/// The units that have failed.
std::vector<std::string> failedUnits();

}  // namespace Machine
}  // namespace ventras
