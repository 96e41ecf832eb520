#pragma once

#include <string>
#include <string_view>

#include "platform/Log.h"

namespace ventras {

/// The log as syslog(3) keeps it, and standard error too where somebody reads it: a terminal, or the stream
/// of a service manager, which JOURNAL_STREAM names. Any other standard error belongs to the program that
/// started us. Any thread may write.
class Syslog : public Log {
public:
    Syslog();
    void error(const std::string& line) override;

private:
    bool alsoOnStandardError_;
};

/// A text in which control characters and broken UTF-8 stand as "\xNN", so that it stays one line of a log.
std::string harmlessLine(std::string_view text);

}  // namespace ventras
