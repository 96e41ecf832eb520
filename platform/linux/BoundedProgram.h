#pragma once

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace ventras {

/// Runs a program to its end, without a shell, its standard error left to the caller's, its input empty.
/// @param arguments the first is the program: a path, or a name that is looked up in PATH
/// @param variables on top of this process's environment
/// @param limit after which it is ended, and all that it started in its process group
/// @return its standard output; absent when it cannot be started, fails, takes too long, or prints more than
///         64 MiB.
std::optional<std::string> outputOf(const std::vector<std::string>& arguments,
                                    const std::map<std::string, std::string>& variables,
                                    std::chrono::milliseconds limit);

}  // namespace ventras
