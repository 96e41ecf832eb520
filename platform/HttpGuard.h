#pragma once

#include <cups/cups.h>

#include "platform/Alarm.h"
#include "platform/Deadline.h"

namespace ventras {

/// Ends an HTTP connection's reads and writes at a deadline, whatever the other side does.
///
/// libcups bounds each wait but not their sum: a peer that sends a byte now and then, or half an answer,
/// holds a caller for minutes. At the deadline the guard shuts the connection's socket down, which fails the
/// pending read; it goes on doing so until it is destroyed, because libcups may reconnect by itself.
///
/// Construct and destroy it on the thread that uses the connection, and destroy it before the connection.
class HttpGuard {
public:
    HttpGuard(http_t* connection, Deadline deadline);
    ~HttpGuard();
    HttpGuard(const HttpGuard&) = delete;
    HttpGuard& operator=(const HttpGuard&) = delete;

private:
    http_t* connection_;
    Deadline deadline_;
    Alarm alarm_;
};

}  // namespace ventras
