#include "tests/install/FakePackageKit.h"

#include <algorithm>

namespace ventras {
namespace {

constexpr const char* kService = "org.freedesktop.PackageKit";
constexpr const char* kPath = "/org/freedesktop/PackageKit";
constexpr const char* kTransaction = "org.freedesktop.PackageKit.Transaction";

constexpr const char* kServiceMembers =
    "<method name='CreateTransaction'><arg type='o' direction='out'/></method>";
constexpr const char* kTransactionMembers =
    "<method name='SetHints'><arg type='as' direction='in'/></method>"
    "<method name='Resolve'><arg type='t' direction='in'/><arg type='as' direction='in'/></method>"
    "<method name='InstallPackages'><arg type='t' direction='in'/><arg type='as' direction='in'/></method>"
    "<method name='RemovePackages'><arg type='t' direction='in'/><arg type='as' direction='in'/>"
    "<arg type='b' direction='in'/><arg type='b' direction='in'/></method>"
    "<method name='AcceptEula'><arg type='s' direction='in'/></method>"
    "<method name='Cancel'/><property name='AllowCancel' type='b' access='read'/>";

constexpr guint64 kInstalledFilter = 1U << 2U;
constexpr guint64 kOnlyTrusted = 1U << 1U;
constexpr guint64 kSimulate = 1U << 2U;

constexpr unsigned kInstalled = 1;
constexpr unsigned kAvailable = 2;
constexpr unsigned kInstalling = 12;
constexpr unsigned kSuccess = 1;

std::string idOf(const std::string& name) {
    return name + ";1.0;all;repository";
}

std::string nameIn(const std::string& id) {
    return id.substr(0, id.find(';'));
}

std::vector<std::string> textsIn(GVariant* list) {
    std::vector<std::string> texts;
    for (gsize i = 0; i < g_variant_n_children(list); ++i) {
        const VariantPtr text{g_variant_get_child_value(list, i)};
        texts.emplace_back(g_variant_get_string(text.get(), nullptr));
    }
    return texts;
}

guint64 flagsIn(GVariant* arguments) {
    const VariantPtr flags{g_variant_get_child_value(arguments, 0)};
    return g_variant_get_uint64(flags.get());
}

std::vector<std::string> itemsIn(GVariant* arguments) {
    if (g_variant_n_children(arguments) < 2)
        return {};
    const VariantPtr list{g_variant_get_child_value(arguments, 1)};
    return textsIn(list.get());
}

// Installing without "only trusted" is another call, so that no test takes it for the one it waits for.
std::string callNamed(const std::string& method, GVariant* arguments) {
    if (method == "RemovePackages")
        return "Remove";
    if (method != "InstallPackages")
        return method;
    const auto flags = flagsIn(arguments);
    const std::string trust = (flags & kOnlyTrusted) != 0 ? "" : "Untrusted";
    return trust + ((flags & kSimulate) != 0 ? "Simulate" : "Install");
}

}  // namespace

FakeTransaction::FakeTransaction(GDBusConnection* connection, const std::string& path, BusObject::Calls calls)
    : object_(connection, path, kTransaction, kTransactionMembers, std::move(calls),
              [this](const std::string&) { return g_variant_new_boolean(allowsCancel_ ? TRUE : FALSE); }) {}

void FakeTransaction::package(unsigned info, const std::string& id) {
    object_.emit("Package", g_variant_new("(uss)", info, id.c_str(), "a summary"));
}

void FakeTransaction::error(unsigned code, const std::string& text) {
    object_.emit("ErrorCode", g_variant_new("(us)", code, text.c_str()));
}

void FakeTransaction::licence(const std::string& id, const std::string& vendor, const std::string& text) {
    object_.emit("EulaRequired",
                 g_variant_new("(ssss)", id.c_str(), "a;1;all;", vendor.c_str(), text.c_str()));
}

void FakeTransaction::progress(unsigned percent) {
    object_.emitChanged("Percentage", g_variant_new_uint32(percent));
}

void FakeTransaction::forbidCancel() {
    allowsCancel_ = false;
    object_.emitChanged("AllowCancel", g_variant_new_boolean(FALSE));
}

void FakeTransaction::finish(unsigned exit) {
    object_.emit("Finished", g_variant_new("(uu)", exit, 1U));
}

FakePackageKit::FakePackageKit(std::vector<std::string> packages, Plays plays)
    : plays_(std::move(plays)), thread_([&](GDBusConnection* connection) {
          for (const auto& package : packages)
              packages_.emplace(package.substr(package.starts_with('+') ? 1 : 0), package.starts_with('+'));
          offer(connection);
      }) {}

void FakePackageKit::offer(GDBusConnection* connection) {
    connection_ = connection;
    service_ = std::make_unique<BusObject>(
        connection, kPath, kService, kServiceMembers,
        [this, connection](const std::string&, GVariant*, GDBusMethodInvocation* invocation) {
            const auto path = "/" + std::to_string(transactions_.size()) + "_fake";
            const auto index = transactions_.size();
            transactions_.push_back(std::make_unique<FakeTransaction>(
                connection, path,
                [this, index](const std::string& method, GVariant* arguments, GDBusMethodInvocation* call) {
                    g_dbus_method_invocation_return_value(call, nullptr);
                    onCall(*transactions_.at(index), method, arguments);
                }));
            g_dbus_method_invocation_return_value(invocation, g_variant_new("(o)", path.c_str()));
        });
    callBus(connection, "RequestName", g_variant_new("(su)", kService, 0U));
}

void FakePackageKit::onCall(FakeTransaction& transaction, const std::string& method, GVariant* arguments) {
    if (method == "SetHints")
        return;
    const auto call = callNamed(method, arguments);
    const auto items = itemsIn(arguments);
    {
        const std::lock_guard lock(mutex_);
        auto line = call;
        for (const auto& item : items)
            line += " " + item;
        calls_.push_back(line);
    }
    if (const auto play = plays_.find(call); play != plays_.end())
        play->second(transaction);
    else if (call != "Cancel")
        goWell(transaction, call, items, call == "Resolve" && (flagsIn(arguments) & kInstalledFilter) != 0);
}

void FakePackageKit::goWell(FakeTransaction& transaction, const std::string& call,
                            const std::vector<std::string>& items, bool onlyInstalled) {
    const std::lock_guard lock(mutex_);
    for (const auto& item : items) {
        const auto name = nameIn(item);
        const auto package = packages_.find(name);
        if (package == packages_.end())
            continue;
        auto& isThere = package->second;
        if (call == "Resolve" && (isThere || !onlyInstalled))
            transaction.package(isThere ? kInstalled : kAvailable, idOf(name));
        else if (call == "Simulate")
            transaction.package(kInstalling, item);
        else if (call == "Install" || call == "Remove")
            isThere = call == "Install";
    }
    transaction.finish(kSuccess);
}

std::vector<std::string> FakePackageKit::calls() {
    const std::lock_guard lock(mutex_);
    return calls_;
}

bool FakePackageKit::was(const std::string& call) {
    return std::ranges::any_of(calls(), [&](const std::string& line) { return line.starts_with(call); });
}

bool FakePackageKit::isInstalled(const std::string& package) {
    const std::lock_guard lock(mutex_);
    return packages_.at(package);
}

void FakePackageKit::goAway() {
    callBus(connection_, "ReleaseName", g_variant_new("(s)", kService));
}

}  // namespace ventras
