#pragma once

#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <string>
#include <vector>

#include "tests/platform-linux/BusThread.h"

namespace ventras {

/// Hears the notifications of the print system on the bus of the environment.
class PostedNotifications {
public:
    /// Waits for so many. @return all that were posted, as GVariant prints them.
    std::vector<std::string> heard(std::size_t count);

private:
    void listen(GDBusConnection* connection);
    static void onSignal(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                         GVariant* parameters, gpointer self);

    std::mutex mutex_;
    std::condition_variable changed_;
    std::vector<std::string> heard_;
    BusThread thread_{[this](GDBusConnection* connection) { listen(connection); }};
};

}  // namespace ventras
