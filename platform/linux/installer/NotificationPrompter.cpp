#include "platform/linux/installer/NotificationPrompter.h"

#include <array>

namespace ventras {
namespace {

constexpr const char* kService = "org.freedesktop.Notifications";
constexpr const char* kPath = "/org/freedesktop/Notifications";
constexpr auto kLimit = std::chrono::seconds(5);

constexpr const char* kProgramName = "ventrasagent";
constexpr const char* kYes = "install";
constexpr const char* kNo = "cancel";
constexpr gint32 kUntilClosed = 0;
constexpr gint32 kAsLongAsUsual = -1;
constexpr guchar kUrgent = 2;  // stays until it is answered, and is shown above what fills the screen

GVariant* buttonsOf(const InstallQuestion& question) {
    const std::array<const char*, 4> buttons{kYes, question.yes.c_str(), kNo, question.no.c_str()};
    return g_variant_new_strv(buttons.data(), buttons.size());
}

GVariant* noButtons() {
    return g_variant_new_strv(nullptr, 0);
}

}  // namespace

PromptAnswer NotificationPrompter::ask(const InstallQuestion& question, Deadline deadline) {
    if (!connect() || !has("actions"))
        return PromptAnswer::NotAsked;
    answer_.reset();
    icon_ = question.icon;
    GVariant* hints = g_variant_new_parsed("{'urgency': <%y>, 'resident': <true>}", kUrgent);
    if (!notify(question.title, question.body, buttonsOf(question), hints))
        return PromptAnswer::NotAsked;
    events_.waitUntil([this] { return answer_ || service_->isLost(); }, deadline);
    if (answer_ == PromptAnswer::Yes)
        return PromptAnswer::Yes;
    if (!answer_ && service_->isLost())
        return PromptAnswer::NotAsked;
    close();
    return answer_.value_or(PromptAnswer::Unanswered);
}

bool NotificationPrompter::connect() {
    if (service_)
        return !service_->isLost();
    connection_.emplace(Bus::Session, kLimit);
    if (connection_->get() == nullptr)
        return false;
    auto answer = call("GetCapabilities", g_variant_new("()"), "(as)");
    if (!answer.reply)
        return false;
    capabilities_ = std::move(answer.reply);
    service_.emplace(*connection_, kService);
    if (service_->isLost())
        return false;
    signals_.emplace(*connection_, service_->owner(), kService, kPath,
                     [this](std::string_view member, GVariant* arguments) { onSignal(member, arguments); });
    return true;
}

bool NotificationPrompter::has(std::string_view capability) const {
    const VariantPtr list{g_variant_get_child_value(capabilities_.get(), 0)};
    for (gsize i = 0; i < g_variant_n_children(list.get()); ++i) {
        const VariantPtr text{g_variant_get_child_value(list.get(), i)};
        if (g_variant_get_string(text.get(), nullptr) == capability)
            return true;
    }
    return false;
}

DBusAnswer NotificationPrompter::call(const char* method, GVariant* arguments, const char* replyType) const {
    const DBusMethod notifications{Bus::Session, kService, kPath, kService, method};
    return connection_->call(notifications, arguments, replyType, kLimit, events_.cancellable());
}

bool NotificationPrompter::notify(const std::string& title, const std::string& body, GVariant* buttons,
                                  GVariant* hints) {
    const auto text = has("body-markup") ? escapeMarkup(body) : body;
    const auto timeLimit = g_variant_n_children(buttons) > 0 ? kUntilClosed : kAsLongAsUsual;
    const auto answer = call("Notify",
                             g_variant_new("(susss@as@a{sv}i)", kProgramName, id_, icon_.c_str(),
                                           title.c_str(), text.c_str(), buttons, hints, timeLimit),
                             "(u)");
    if (!answer.reply)
        return false;
    g_variant_get(answer.reply.get(), "(u)", &id_);
    return true;
}

void NotificationPrompter::close() {
    if (id_ != 0)
        call("CloseNotification", g_variant_new("(u)", id_), "()");
    id_ = 0;
}

void NotificationPrompter::showProgress(const std::string& text, std::optional<std::uint32_t> percent) {
    if (!service_ || service_->isLost())
        return;
    GVariantBuilder hints;
    g_variant_builder_init(&hints, G_VARIANT_TYPE_VARDICT);
    if (percent)
        g_variant_builder_add(&hints, "{sv}", "value", g_variant_new_int32(static_cast<gint32>(*percent)));
    notify(text, percent ? std::to_string(*percent) + " %" : "", noButtons(), g_variant_builder_end(&hints));
}

void NotificationPrompter::finish(const std::string& title, const std::string& message) {
    if (!service_ || service_->isLost())
        return;
    if (title.empty())
        close();
    else
        notify(title, message, noButtons(), g_variant_new_parsed("@a{sv} {}"));
}

// The identifier comes with the reply to Notify, which the service sends before anything about it.
void NotificationPrompter::onSignal(std::string_view member, GVariant* arguments) {
    guint32 id = 0;
    if (answer_)
        return;
    if (member == "ActionInvoked" && g_variant_is_of_type(arguments, G_VARIANT_TYPE("(us)")) != FALSE) {
        const char* key = nullptr;
        g_variant_get(arguments, "(u&s)", &id, &key);
        if (id == id_ && std::string_view(key) == kYes)
            answer_ = PromptAnswer::Yes;
        else if (id == id_ && std::string_view(key) == kNo)
            answer_ = PromptAnswer::No;
    } else if (member == "NotificationClosed" &&
               g_variant_is_of_type(arguments, G_VARIANT_TYPE("(uu)")) != FALSE) {
        g_variant_get(arguments, "(uu)", &id, nullptr);
        if (id == id_)
            answer_ = PromptAnswer::Unanswered;
    }
}

}  // namespace ventras
