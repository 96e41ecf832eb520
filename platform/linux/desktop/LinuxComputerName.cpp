#include "platform/linux/desktop/LinuxComputerName.h"

#include <unistd.h>

#include <algorithm>
#include <array>

#include "platform/FileContent.h"
#include "platform/Utf8.h"
#include "platform/linux/desktop/DBusCall.h"

namespace ventras {
namespace {

constexpr DBusMethod kGetProperty{Bus::System, "org.freedesktop.hostname1", "/org/freedesktop/hostname1",
                                  "org.freedesktop.DBus.Properties", "Get"};
constexpr auto kLimit = std::chrono::seconds(2);
constexpr std::string_view kBlanks = " \t\r\n";

using Name = std::optional<std::string>;

Name usable(std::string_view text) {
    const auto begin = text.find_first_not_of(kBlanks);
    if (begin == std::string_view::npos || !isValidUtf8(text) || hasControlCharacters(text.substr(begin)))
        return std::nullopt;
    return std::string(text);
}

Name hostnameServiceProperty(const char* property) {
    const auto answer = callDBus(kGetProperty, g_variant_new("(ss)", "org.freedesktop.hostname1", property),
                                 "(v)", kLimit, DBusCallMode::RunningOnly);
    if (!answer.reply)
        return std::nullopt;
    GVariant* value = nullptr;
    g_variant_get(answer.reply.get(), "(v)", &value);
    const VariantPtr owner{value};
    if (!g_variant_is_of_type(value, G_VARIANT_TYPE_STRING))
        return std::nullopt;
    return usable(g_variant_get_string(value, nullptr));
}

Name firstLineOf(const std::filesystem::path& path) {
    const auto content = fileContent(path).value_or("");
    return usable(std::string_view(content).substr(0, content.find('\n')));
}

Name kernelName() {
    std::array<char, 256> name{};
    if (gethostname(name.data(), name.size() - 1) != 0)
        return std::nullopt;
    const std::string_view text(name.data());
    return usable(text.substr(0, text.find('.')));
}

Name lookUp(const std::filesystem::path& folder) {
    if (auto name = hostnameServiceProperty("PrettyHostname"))
        return name;
    const auto pretty = shellAssignment(fileContent(folder / "machine-info").value_or(""), "PRETTY_HOSTNAME");
    if (auto name = pretty ? usable(*pretty) : std::nullopt)
        return name;
    if (auto name = firstLineOf(folder / "hostname"))
        return name;
    return kernelName();
}

std::string unquoted(std::string_view value) {
    std::string text;
    char quote = 0;
    for (std::size_t i = 0; i < value.size(); ++i) {
        const char c = value[i];
        if (c == '\\' && quote != '\'' && i + 1 < value.size())
            text += value[++i];
        else if (quote != 0 ? c == quote : c == '"' || c == '\'')
            quote = quote != 0 ? '\0' : c;
        else
            text += c;
    }
    return text;
}

}  // namespace

std::optional<std::string> LinuxComputerName::computerName() {
    std::call_once(looked_, [this] { name_ = lookUp(folder_); });
    return name_;
}

std::optional<std::string> shellAssignment(std::string_view file, std::string_view key) {
    std::optional<std::string> found;  // the last assignment counts, as in a shell
    while (!file.empty()) {
        const auto end = file.find('\n');
        auto line = file.substr(0, end);
        file.remove_prefix(end == std::string_view::npos ? file.size() : end + 1);
        line.remove_prefix(std::min(line.find_first_not_of(kBlanks), line.size()));
        if (!line.starts_with(key) || line.substr(key.size(), 1) != "=")
            continue;
        const auto value = line.substr(key.size() + 1);
        found = unquoted(value.substr(0, value.find_last_not_of(kBlanks) + 1));
    }
    return found && found->empty() ? std::nullopt : found;
}

}  // namespace ventras
