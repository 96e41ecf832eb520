#include "queues/QueueStatus.h"

#include <algorithm>
#include <array>

#include "devices/VentrasPrinterObject.h"
#include "platform/PrintSystemService.h"

namespace ventras::QueueStatus {
namespace {

struct Text {
    std::int32_t status;
    std::string_view text;
};

constexpr std::array kTexts{
    Text{kNoDriver, "no driver for it was found"},
    Text{kCannotHandle, "it is of no kind that can be set up"},
    Text{kNoDevice, "there is no device"},
    Text{kCannotSerialize, "its description cannot be stored, or the print server has no address"},
    Text{kNoIdentifier, "no queue name can be made of its name"},
    Text{PrintSystemStatus::kBadData, "its settings are not safe to use"},
    Text{PrintSystemStatus::kUnavailable, "the print scheduler, or the printer itself, does not answer"},
    Text{PrintSystemStatus::kCannotCreate, "the print scheduler refuses the queue"},
    Text{PrintSystemStatus::kNoPermission, "the print scheduler does not let this user make queues"},
};

}  // namespace

std::string_view describe(std::int32_t status) {
    const auto known = std::ranges::find(kTexts, status, &Text::status);
    return known == kTexts.end() ? "the print system reports this status" : known->text;
}

std::string describe(std::int32_t status, VentrasPrinterObject& device) {
    const auto difficulty = status == kCannotHandle ? device.difficulty() : std::nullopt;
    return difficulty ? *difficulty : std::string(describe(status));
}

}  // namespace ventras::QueueStatus
