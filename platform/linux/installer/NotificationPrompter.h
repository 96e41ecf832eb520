#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/installer/DBusSubscription.h"
#include "platform/linux/installer/EventContext.h"
#include "platform/linux/installer/Prompter.h"

namespace ventras {

/// Asks by a desktop notification with two buttons (Desktop Notifications Specification 1.2), where the
/// session has a notification service that shows buttons.
///
/// A notification that is closed without a button was not answered: the user may have swept it away among
/// others. A service that goes away in the middle has not asked.
class NotificationPrompter : public Prompter {
public:
    explicit NotificationPrompter(EventContext& events) : events_(events) {}

    PromptAnswer ask(const InstallQuestion& question, Deadline deadline) override;
    void showProgress(const std::string& text, std::optional<std::uint32_t> percent) override;
    void finish(const std::string& title, const std::string& message) override;

private:
    bool connect();
    bool has(std::string_view capability) const;
    DBusAnswer call(const char* method, GVariant* arguments, const char* replyType) const;
    bool notify(const std::string& title, const std::string& body, GVariant* buttons, GVariant* hints);
    void close();
    void onSignal(std::string_view member, GVariant* arguments);

    EventContext& events_;
    std::optional<DBusConnection> connection_;
    std::optional<DBusService> service_;
    std::optional<DBusSubscription> signals_;
    VariantPtr capabilities_;
    std::string icon_;
    guint32 id_ = 0;  // of the notification that is shown; 0 = none
    std::optional<PromptAnswer> answer_;
};

}  // namespace ventras
