#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace ventras {

class VentrasPrinterObject;

/// Outcomes of making a queue that are this system's own; every other value is the print system's.
namespace QueueStatus {
inline constexpr std::int32_t kCreated = 0;
inline constexpr std::int32_t kAlreadyExists =
    242;  ///< a queue serves the device, or another process makes it
inline constexpr std::int32_t kNoDriver = 241;
inline constexpr std::int32_t kCannotHandle = 255;
inline constexpr std::int32_t kNoDevice = -1;
inline constexpr std::int32_t kCannotSerialize = -30886;  ///< or the local server's address is not known
inline constexpr std::int32_t kNoIdentifier = -620;

/// Whether the device is served now: by a new queue, or by one that was there.
constexpr bool isServed(std::int32_t status) {
    return status == kCreated || status == kAlreadyExists;
}

/// Why a device that is not served has no queue, in words for the log and for people. Any thread may call.
/// @param status one of these, or a PrintSystemStatus
std::string_view describe(std::int32_t status);

/// The same of one device, which may know better what it lacks. On the thread of the device.
std::string describe(std::int32_t status, VentrasPrinterObject& device);
}  // namespace QueueStatus

}  // namespace ventras
