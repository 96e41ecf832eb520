#pragma once

#include <optional>
#include <string>

namespace ventras {

/// A variable of the environment in which the scheduler starts its backends; absent when it is not set.
std::optional<std::string> schedulerVariable(const char* name);

/// The device URI of the job's queue, as the scheduler hands it to a backend.
std::string jobDeviceURI(char* arguments[]);

/// Where a program of the scheduler lies.
/// @param program its path below the scheduler's folder of programs, e.g. "backend/ipp"
std::string schedulerProgram(const std::string& program);

/// Turns this process into a backend that the scheduler brings along: the job's data, signals and exit status
/// are its own from here on. One thread.
/// @param program as for schedulerProgram()
/// @param uri what the backend takes for the queue's device URI; absent where it is not called for a job
/// @return only when it cannot be started, with the exit status for that; the job's log then says why.
int becomeStockBackend(const std::string& program, std::optional<std::string> uri, char* arguments[]);

}  // namespace ventras
