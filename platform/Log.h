#pragma once

#include <string>

namespace ventras {

/// The system log. Any thread may write to it.
class Log {
public:
    virtual ~Log() = default;

    /// One line at error level: what happened, to which device, and why. Control characters in it, which may
    /// come from a device, are made harmless.
    virtual void error(const std::string& line) = 0;
};

}  // namespace ventras
