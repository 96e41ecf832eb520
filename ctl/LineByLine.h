#pragma once

#include <functional>
#include <optional>
#include <string>

#include "ctl/Exit.h"
#include "ctl/Value.h"

namespace ventras {

class Output;

/// Answers each line of standard input with one line of JSON, so that thousands cost one process. A line that
/// cannot be understood is answered with null, and makes the exit status Usage.
/// @param answer absent when the line cannot be understood
Exit answerLines(Output& output, const std::function<std::optional<Value>(const std::string&)>& answer);

/// All of standard input.
std::string readStandardInput();

}  // namespace ventras
