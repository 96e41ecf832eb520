#pragma once

#include "platform/PrintToolAgentChannel.h"

namespace ventras {

/// The channel over the session bus: method Command(u command, a{sv} arguments) -> a{sv}. A service's name is
/// also the name of its interface and, with "/" for ".", of its object. Any thread may send.
class DBusPrintToolAgentChannel : public PrintToolAgentChannel {
public:
    PrintToolAgentReply sendCommandSync(std::string_view service, std::int32_t command,
                                        const PropertyDictionary& arguments) override;
};

}  // namespace ventras
