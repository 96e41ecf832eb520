#pragma once

#include <cstdint>
#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// Keys of a command's arguments and of the reply to it.
namespace PrintToolAgentKeys {
inline constexpr const char* kScanID = "scanID";  ///< argument: a device ID in any form, a text
inline constexpr const char* kVellum = "Vellum";  ///< argument: drivers for driverless printing count, too
inline constexpr const char* kCount = "count";    ///< reply: how many packages are equally good
inline constexpr const char* kConflicts = "conflicts";  ///< reply: their names, when they are several
inline constexpr const char* kIsCacheCurrent = "is_cache_current";  ///< reply: it is for the running release
}  // namespace PrintToolAgentKeys

/// What the printing user-interface tool's agent answered.
struct PrintToolAgentReply {
    std::int32_t status = 0;        ///< 0 = `dictionary` is the reply
    PropertyDictionary dictionary;  ///< by PrintToolAgentKeys
};

/// Synchronous commands to the agent service of the printing user-interface tool. Any thread may send; it
/// blocks.
class PrintToolAgentChannel {
public:
    static constexpr std::string_view kService = "com.quillon.lorvextool.agent";
    /// Asks how many driver packages the catalogue holds for a device.
    static constexpr std::int32_t kCountDriverPackages = 1;

    virtual ~PrintToolAgentChannel() = default;

    /// @param arguments by PrintToolAgentKeys
    /// @return a non-zero status at once when the service is absent.
    virtual PrintToolAgentReply sendCommandSync(std::string_view service, std::int32_t command,
                                                const PropertyDictionary& arguments) = 0;
};

/// A reply's count of packages as an integer; 0 when it is absent or no number.
std::int64_t packageCount(const PrintToolAgentReply& reply);

}  // namespace ventras
