#pragma once

#include <cstdint>
#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// What the printing user-interface tool's agent answered.
struct PrintToolAgentReply {
    std::int32_t status = 0;        ///< 0 = `dictionary` is the reply
    PropertyDictionary dictionary;  ///< e.g. "count", "conflicts", "is_cache_current"
};

/// Synchronous commands to the agent service of the printing user-interface tool. Any thread may send; it
/// blocks.
class PrintToolAgentChannel {
public:
    static constexpr std::string_view kService = "com.quillon.lorvextool.agent";
    /// Asks how many driver packages the catalogue holds for the device ID under "scanID".
    static constexpr std::int32_t kCountDriverPackages = 1;

    virtual ~PrintToolAgentChannel() = default;

    /// @return a non-zero status at once when the service is absent.
    virtual PrintToolAgentReply sendCommandSync(std::string_view service, std::int32_t command,
                                                const PropertyDictionary& arguments) = 0;
};

/// A reply's "count" as an integer; 0 when it is absent or no number.
std::int64_t packageCount(const PrintToolAgentReply& reply);

}  // namespace ventras
