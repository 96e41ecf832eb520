#include "tests/parts/SchedulerFolder.h"

#include <grp.h>
#include <pwd.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <fstream>
#include <string_view>
#include <system_error>

namespace ventras {
namespace {

namespace fs = std::filesystem;

const fs::path kSystemPrograms = "/usr/lib/cups";
const fs::path kSystemData = "/usr/share/cups";

// Lays each job down as a file where tests find it. Called without arguments, a backend lists its devices.
constexpr std::string_view kSinkBackend = R"(#!/bin/sh
[ $# -eq 0 ] && exit 0
out="$TMPDIR/sink-$PRINTER-$1"
cat ${6:+"$6"} > "$out.part" && mv "$out.part" "$out"
)";

// The system's own versions of these are closed to ordinary users or do not exist.
constexpr std::array kSinkSchemes{"usb", "ippusb", "riousb", "dnssd", "mdns", "lpd"};
constexpr std::array kNetworkSchemes{"ipp", "ipps", "http", "https"};

constexpr std::string_view kOpenPolicy = R"(
DefaultAuthType None
<Policy default>
  JobPrivateAccess all
  JobPrivateValues none
  SubscriptionPrivateAccess all
  SubscriptionPrivateValues none
)";

constexpr std::string_view kAllowEverything = R"(
  <Limit All>
    AuthType None
    Order deny,allow
  </Limit>
</Policy>
)";

constexpr std::string_view kRefuseAdditions = R"(
  <Limit CUPS-Add-Modify-Printer>
    AuthType None
    Require user nobody-at-all
    Order deny,allow
  </Limit>
)";

constexpr std::string_view kStockPolicy = R"(
DefaultAuthType Basic
<Policy default>
  JobPrivateAccess default
  JobPrivateValues default
  SubscriptionPrivateAccess default
  SubscriptionPrivateValues default
  <Limit Create-Job Print-Job Print-URI Validate-Job>
    Order deny,allow
  </Limit>
  <Limit CUPS-Add-Modify-Printer CUPS-Delete-Printer CUPS-Add-Modify-Class CUPS-Delete-Class CUPS-Set-Default CUPS-Get-Devices>
    AuthType Default
    Require user @SYSTEM
    Order deny,allow
  </Limit>
  <Limit All>
    Order deny,allow
  </Limit>
</Policy>
)";

std::string policyText(SchedulerPolicy policy) {
    switch (policy) {
        case SchedulerPolicy::stock:
            return std::string(kStockPolicy);
        case SchedulerPolicy::refusesAdditions:
            return std::string(kOpenPolicy).append(kRefuseAdditions).append(kAllowEverything);
        case SchedulerPolicy::open:
            break;
    }
    return std::string(kOpenPolicy).append(kAllowEverything);
}

std::string groupName(std::optional<uid_t> user) {
    const passwd* entry = getpwuid(user.value_or(getuid()));
    const group* groupEntry = entry != nullptr ? getgrgid(entry->pw_gid) : nullptr;
    return groupEntry != nullptr ? groupEntry->gr_name : "root";
}

void writeFile(const fs::path& path, std::string_view content, fs::perms mode) {
    std::ofstream(path, std::ios::binary) << content;
    fs::permissions(path, mode);
}

void furnishPrograms(const fs::path& programs, const std::map<std::string, std::string>& backends) {
    constexpr fs::perms executable{0755};
    const auto backend = programs / "backend";
    fs::create_directories(backend);
    for (const char* folder : {"cgi-bin", "daemon", "filter", "monitor", "notifier", "driver"})
        fs::create_symlink(kSystemPrograms / folder, programs / folder);
    for (const char* scheme : kNetworkSchemes)
        fs::create_symlink(kSystemPrograms / "backend/ipp", backend / scheme);
    fs::create_symlink(kSystemPrograms / "backend/socket", backend / "socket");
    for (const char* scheme : kSinkSchemes)
        writeFile(backend / scheme, kSinkBackend, executable);
    for (const auto& [scheme, script] : backends) {
        fs::remove(backend / scheme);
        writeFile(backend / scheme, script, executable);
    }
}

// The system's data, but only the given drivers. An own "driver" folder would hide the PPD compiler and the
// collections, so that is what it is here: empty.
fs::path furnishCatalogue(const fs::path& folder, const std::map<std::string, std::string>& models) {
    const auto data = folder / "data";
    fs::create_directories(data / "model");
    for (const auto& entry : fs::directory_iterator(kSystemData))
        if (const auto name = entry.path().filename(); name != "model" && name != "drv")
            fs::create_symlink(entry.path(), data / name);
    for (const auto& [name, ppd] : models)
        writeFile(data / "model" / name, ppd, fs::perms{0644});
    fs::remove(folder / "bin/driver");
    fs::create_directory(folder / "bin/driver");
    return data;
}

std::string filesConfiguration(const fs::path& folder, const fs::path& data, const std::string& group) {
    const auto own = folder.string();
    const std::string text =
        "ServerRoot " + own + "/etc\nStateDir " + own + "/run\nCacheDir " + own + "/cache\nRequestRoot " +
        own + "/spool\nTempDir " + own + "/spool/tmp\nServerKeychain " + own + "/etc/ssl\nServerBin " + own +
        "/bin\nDataDir " + data.string() + "\nDocumentRoot /usr/share/cups/doc-root\nAccessLog " + own +
        "/log/access_log\nErrorLog " + own + "/log/error_log\nPageLog " + own +
        "/log/page_log\nSystemGroup " + group + "\n";
    return text + "Printcap\nFileDevice Yes\nSandboxing Relaxed\nSyncOnClose No\nFatalErrors config\n";
}

std::string daemonConfiguration(const SchedulerOptions& options, const fs::path& socket, std::uint16_t port) {
    std::string text = "LogLevel debug\nMaxLogSize 0\nAccessLogLevel all\nListen " + socket.string() + "\n";
    if (port != 0)
        text += "Listen 127.0.0.1:" + std::to_string(port) + "\n";
    text += "Browsing No\nWebInterface No\nDefaultEncryption Never\nJobRetryInterval 5\nErrorPolicy " +
            options.errorPolicy + "\n";
    for (const char* location : {"/", "/admin"})
        text +=
            std::string("<Location ") + location + ">\n  Order allow,deny\n  Allow localhost\n</Location>\n";
    return text + policyText(options.policy);
}

void giveTo(uid_t user, const fs::path& folder) {
    const auto give = [user](const fs::path& path) {
        const passwd* entry = getpwuid(user);
        if (lchown(path.c_str(), user, entry != nullptr ? entry->pw_gid : user) != 0)
            throw std::system_error(errno, std::generic_category(), path.string());
    };
    give(folder);
    for (const auto& entry : fs::recursive_directory_iterator(folder))
        give(entry.path());
}

}  // namespace

std::optional<uid_t> ordinaryUser() {
    const passwd* nobody = getuid() == 0 ? getpwnam("nobody") : nullptr;
    return nobody == nullptr ? std::nullopt : std::optional{nobody->pw_uid};
}

void furnishSchedulerFolder(const fs::path& folder, const SchedulerOptions& options, const fs::path& socket,
                            std::uint16_t port) {
    for (const char* name : {"etc/ppd", "etc/ssl", "cache", "run/certs", "spool/tmp", "log", "bin"})
        fs::create_directories(folder / name);
    furnishPrograms(folder / "bin", options.backends);
    const auto data = options.models ? furnishCatalogue(folder, *options.models) : kSystemData;
    constexpr fs::perms readable{0644};
    writeFile(folder / "etc/cups-files.conf", filesConfiguration(folder, data, groupName(options.user)),
              readable);
    writeFile(folder / "etc/cupsd.conf", daemonConfiguration(options, socket, port), readable);
    if (!options.printers.empty())
        writeFile(folder / "etc/printers.conf", options.printers, fs::perms{0600});
    if (options.user)
        giveTo(*options.user, folder);
}

}  // namespace ventras
