#include "platform/linux/options/UsbPostScriptChannel.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <utility>

#include "deviceid/TextScan.h"
#include "platform/linux/options/PostScriptReply.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;

// No transfer takes longer, so that a request to end the process is soon seen.
constexpr auto kSlice = 200ms;
// A printer that has printed something and then nothing for so long has answered, even if it does not say so.
constexpr auto kQuiet = 1500ms;
constexpr std::size_t kLongestReply = 65536;
constexpr int kMostStaleReads = 16;

constexpr std::string_view kEndOfJob = "\x04";
constexpr std::string_view kUniversalExit = "\x1b%-12345X";
constexpr std::string_view kEnterPostScript = "@PJL ENTER LANGUAGE=POSTSCRIPT\r\n";

bool names(std::string_view text, std::string_view word) {
    return TextScan::findIgnoringCase(text, word) != std::string_view::npos;
}

/// Whether a command set names PostScript, e.g. "PCL,PostScript" or "PJL,PS".
bool takesPostScript(const std::string& commandSet) {
    if (names(commandSet, "PostScript"))
        return true;
    std::string list = "," + commandSet + ",";
    std::erase(list, ' ');
    return names(list, ",PS,");
}

}  // namespace

UsbPostScriptOpening UsbPostScriptChannel::open(LibusbContext& context, const std::string& deviceURI) {
    auto found = findUsbPrinter(context, deviceURI);
    if (const auto* reason = std::get_if<std::string>(&found))
        return {nullptr, *reason};
    auto& place = std::get<UsbPrinterPlace>(found);
    if (!takesPostScript(place.commandSet))
        return {nullptr, "it does not say that it speaks PostScript"};
    int error = 0;
    auto handle = place.device->open(error);
    if (!handle)
        return {nullptr, std::string("it cannot be opened: ") + libusb_strerror(error)};
    std::unique_ptr<UsbPostScriptChannel> channel(
        new UsbPostScriptChannel(std::move(place), std::move(handle)));
    if (const int failed = channel->claim(); failed != 0)
        return {nullptr, std::string("it is in use: ") + libusb_strerror(failed)};
    return {std::move(channel), {}};
}

UsbPostScriptChannel::UsbPostScriptChannel(UsbPrinterPlace place, LibusbHandle handle)
    : place_(std::move(place)), handle_(std::move(handle)) {}

int UsbPostScriptChannel::claim() {
    // The kernel's driver goes with the claim and comes back with the release.
    libusb_set_auto_detach_kernel_driver(handle_.get(), 1);
    formerSetting_ = place_.device->currentSetting(place_.interface);
    if (const int error = libusb_claim_interface(handle_.get(), place_.interface); error != 0)
        return error;
    claimed_ = true;
    const auto wanted = place_.setting.descriptor.bAlternateSetting;
    if (wanted != formerSetting_)
        if (const int error = libusb_set_interface_alt_setting(handle_.get(), place_.interface, wanted);
            error != 0)
            return error;
    // Whatever the printer said before, it did not say to us.
    for (int i = 0; i < kMostStaleReads && receive(20ms).value_or("") != ""; ++i)
        continue;
    return 0;
}

UsbPostScriptChannel::~UsbPostScriptChannel() {
    if (!claimed_)
        return;
    if (place_.setting.descriptor.bAlternateSetting != formerSetting_)
        libusb_set_interface_alt_setting(handle_.get(), place_.interface, formerSetting_);
    libusb_release_interface(handle_.get(), place_.interface);
    // Closed before the hold ends: the process may end with it.
    handle_.reset();
}

/// The program, and a second one that prints the marker: it runs whatever became of the first.
std::string UsbPostScriptChannel::jobs(std::string_view program, std::string_view marker) const {
    const bool isPjl = names(place_.commandSet, "PJL");
    std::string text;
    if (isPjl)
        text.append(kUniversalExit).append(kEnterPostScript);
    text.append(program).append("\n").append(kEndOfJob);
    text.append("(").append(marker).append(") = flush\n").append(kEndOfJob);
    if (isPjl)
        text.append(kUniversalExit);
    return text;
}

bool UsbPostScriptChannel::send(std::string_view text, Deadline deadline) {
    std::string rest(text);
    while (!rest.empty() && !deadline.passed() && !TerminationHold::requested()) {
        int sent = 0;
        const int error = libusb_bulk_transfer(handle_.get(), *place_.setting.bulkOut,
                                               reinterpret_cast<unsigned char*>(rest.data()),
                                               static_cast<int>(rest.size()), &sent, kSlice.count());
        rest.erase(0, static_cast<std::size_t>(sent));
        if (error != 0 && error != LIBUSB_ERROR_TIMEOUT)
            return false;
    }
    return rest.empty();
}

/// What came, perhaps nothing; absent when nothing can come any more.
std::optional<std::string> UsbPostScriptChannel::receive(std::chrono::milliseconds wait) {
    std::array<unsigned char, 4096> buffer{};
    int received = 0;
    const int error = libusb_bulk_transfer(handle_.get(), *place_.setting.bulkIn, buffer.data(),
                                           buffer.size(), &received, static_cast<unsigned>(wait.count()));
    if (error != 0 && error != LIBUSB_ERROR_TIMEOUT)
        return std::nullopt;
    return std::string(buffer.begin(), buffer.begin() + received);
}

std::optional<std::vector<std::string>> UsbPostScriptChannel::ask(std::string_view program,
                                                                  Deadline deadline) {
    const auto marker = "ventras " + std::to_string(++asked_);
    if (!send(jobs(program, marker), deadline))
        return std::nullopt;
    std::string reply;
    auto lastHeard = Deadline::Clock::now();
    while (!deadline.passed() && !TerminationHold::requested() && reply.size() < kLongestReply) {
        const auto more = receive(kSlice);
        if (!more)
            return std::nullopt;
        const auto now = Deadline::Clock::now();
        if (!more->empty()) {
            reply += *more;
            lastHeard = now;
        }
        auto lines = PostScriptReply::printedLines(reply);
        if (const auto end = std::ranges::find(lines, marker); end != lines.end()) {
            lines.erase(end, lines.end());
            return lines;
        }
        if (!lines.empty() && now - lastHeard > kQuiet)
            return lines;
    }
    return std::nullopt;
}

}  // namespace ventras
