#pragma once

#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "tests/platform-linux/BusObject.h"
#include "tests/platform-linux/BusThread.h"

namespace ventras {

/// A notification as the service was given it.
struct ShownNotification {
    unsigned id = 0;
    unsigned replaces = 0;
    std::string icon, title, body;
    std::map<std::string, std::string> buttons{};  ///< key to text
    std::string hints;                             ///< as GVariant prints them
    int timeLimit = 0;
};

/// The notification service of a desktop, on the bus of the environment, with a user of the test's at the
/// buttons.
class ScriptedNotifications {
public:
    /// What the user, or the service, does with a notification that has buttons; on the service's thread.
    using Reaction = std::function<void(ScriptedNotifications&, unsigned id)>;

    explicit ScriptedNotifications(Reaction reaction = {},
                                   std::vector<std::string> capabilities = {"body", "actions"});

    /// Reactions.
    void press(unsigned id, const std::string& button);
    void close(unsigned id, unsigned reason);
    void goAway();

    /// A user who presses a button.
    static Reaction pressing(const std::string& button);

    std::vector<ShownNotification> shown();

    /// The notifications that were taken away by who had sent them.
    std::vector<unsigned> takenAway();

private:
    void offer(GDBusConnection* connection, const std::vector<std::string>& capabilities);
    ShownNotification note(GVariant* arguments);
    void takeAway(unsigned id);

    Reaction reaction_;
    std::mutex mutex_;
    std::vector<ShownNotification> shown_;
    std::vector<unsigned> takenAway_;
    unsigned lastID_ = 40;
    GDBusConnection* connection_ = nullptr;
    std::unique_ptr<BusObject> service_;
    BusThread thread_;
};

}  // namespace ventras
