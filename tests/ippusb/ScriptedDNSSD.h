#pragma once

#include <dns_sd.h>

#include <chrono>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace ventras {

/// One wake-up of a query's socket, and what the library makes of it.
struct ScriptedWakeUp {
    enum class Kind { Reply, NoReply, Failure };
    Kind kind = Kind::Reply;
    std::chrono::microseconds after{};  ///< since the one before, or since the query began
    DNSServiceErrorType error = kDNSServiceErr_NoError;
    std::string record = {};
};

/// How queries on one interface go.
struct ScriptedQuery {
    DNSServiceErrorType error = kDNSServiceErr_NoError;  ///< of the start
    bool hangs = false;                                  ///< the start does not return until release()
    std::vector<ScriptedWakeUp> wakeUps = {};
};

/// A query that was started.
struct QueryCall {
    DNSServiceFlags flags = 0;
    std::uint32_t interface = 0;
    std::string fullName;
    std::uint16_t type = 0;
    std::uint16_t recordClass = 0;

    bool operator==(const QueryCall&) const = default;
};

/// Stands in for the DNS-SD library's queries in the program that it is linked into, for as long as it lives;
/// one at a time. Unscripted queries fail at once. Set the script before the queries; the rest any thread may
/// ask.
class ScriptedDNSSD {
public:
    ScriptedDNSSD();
    ScriptedDNSSD(const ScriptedDNSSD&) = delete;
    ScriptedDNSSD& operator=(const ScriptedDNSSD&) = delete;
    ~ScriptedDNSSD();

    /// By interface index.
    std::map<std::uint32_t, ScriptedQuery> queries;

    std::vector<QueryCall> calls() const;

    /// Queries that were started and not given back yet.
    int alive() const;

    /// Lets hanging starts return, and waits until their queries are given back.
    void release();

    /// What a proper answer looks like.
    static ScriptedQuery answering(std::string record);
};

}  // namespace ventras
