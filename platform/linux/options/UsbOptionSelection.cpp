#include "platform/linux/options/UsbOptionSelection.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "platform/FileContent.h"
#include "platform/Handles.h"
#include "platform/Log.h"
#include "platform/TemporaryFile.h"
#include "platform/linux/options/PostScriptReply.h"

namespace ventras {
namespace {

using namespace std::string_view_literals;

// The product is in statusdict before PostScript level 2, and in systemdict since. Which protocol the channel
// follows is a parameter of the device "%USB%"; few printers have that, and what they do not tell prints
// nothing.
constexpr std::string_view kAskProduct =
    "%!PS-Adobe-3.0 Query\n"
    "statusdict begin product == flush end\n"
    "{ (%USB%) currentdevparams /Protocol get == flush } stopped pop\n";

// The protocols that take every byte as it is; the others give meanings to control characters.
constexpr std::array kBinaryProtocols{"/Raw"sv, "/Binary"sv};

Deadline sooner(Deadline one, Deadline other) {
    return one.moment() < other.moment() ? one : other;
}

std::optional<TemporaryFile> temporaryFileWith(std::string_view text) {
    auto file = TemporaryFile::create();
    if (!file || !writeAll(file->descriptor(), text))
        return std::nullopt;
    file->close();
    return file;
}

}  // namespace

std::unique_ptr<UsbPostScriptChannel> UsbOptionSelection::openChannel() {
    auto opening = UsbPostScriptChannel::open(context_, deviceURI_);
    if (!opening.channel)
        log_.error("printer " + deviceURI_ + " is not asked about itself: " + opening.failure);
    return std::move(opening.channel);
}

std::int32_t UsbOptionSelection::autoSelectPPD() {
    info_ = {};
    const auto channel = openChannel();
    if (!channel)
        return PrintSystemStatus::kUnavailable;
    const auto lines = channel->ask(kAskProduct, Deadline::after(kAnswerLimit));
    if (!lines) {
        log_.error("printer " + deviceURI_ + " does not tell its product: no answer in time");
        return PrintSystemStatus::kSuccess;
    }
    for (const auto& line : *lines) {
        if (const auto product = PostScriptReply::stringValue(line);
            product && !product->empty() && !info_.product)
            info_.product = "(" + *product + ")";  // as PPDs write it
        info_.isBinaryOK |= std::ranges::find(kBinaryProtocols, line) != kBinaryProtocols.end();
    }
    return PrintSystemStatus::kSuccess;
}

std::map<std::string, std::string> UsbOptionSelection::askAbout(const std::vector<PpdQuery>& queries) {
    std::map<std::string, std::string> choices;
    const auto channel = openChannel();
    if (!channel)
        return choices;
    const auto deadline = Deadline::after(kLimit);
    for (const auto& query : queries) {
        const auto lines = channel->ask(query.program, sooner(deadline, Deadline::after(kAnswerLimit)));
        if (!lines) {
            log_.error("printer " + deviceURI_ + " does not tell its option " + query.option +
                       ": no answer in time; it stays as the driver has it");
            break;
        }
        if (const auto choice = chosenBy(query, *lines))
            choices[query.option] = *choice;
    }
    return choices;
}

std::int32_t UsbOptionSelection::autoSelectInstallableOptions(const std::string& ppdPath) {
    newPPD_.reset();
    const PpdPtr ppd{ppdOpenFile(ppdPath.c_str())};
    if (!ppd)
        return PrintSystemStatus::kBadData;
    const auto queries = installableOptionQueries(ppd.get());
    if (queries.empty())
        return PrintSystemStatus::kSuccess;
    const auto text = fileContent(ppdPath);
    if (!text)
        return PrintSystemStatus::kBadData;
    const auto newText = withDefaults(*text, askAbout(queries));
    if (newText == *text)
        return PrintSystemStatus::kSuccess;
    auto file = temporaryFileWith(newText);
    if (!file)
        return PrintSystemStatus::kUnavailable;
    newPPD_.hold(std::move(*file));
    return PrintSystemStatus::kSuccess;
}

}  // namespace ventras
