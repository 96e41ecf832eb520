#pragma once

#include <sys/types.h>

#include <cstddef>
#include <set>
#include <string>

namespace ventras {

/// What this process holds of the kernel. Any thread may take one.
struct Census {
    std::set<std::string> descriptors;  ///< each with what it leads to
    std::size_t threads = 0;

    static Census take();

    /// Waits for up to 4 s until nothing exceeds another census: what a thread held goes a moment after its
    /// work, and connections that nobody uses are kept for 2 s.
    static Census takeWhenAtMost(const Census& other);

    bool exceeds(const Census& other) const {
        return descriptors.size() > other.descriptors.size() || threads > other.threads;
    }

    /// What it has more than another, for people.
    std::string excessOver(const Census& other) const;
};

/// Whether any process of a group is left. Any thread may call.
bool isGroupAlive(pid_t group);

}  // namespace ventras
