#pragma once

#include <string_view>

#include "platform/PropertyValue.h"

namespace ventras {

/// System-wide notifications that any process may listen to. Main thread only.
class NotificationBroadcast {
public:
    virtual ~NotificationBroadcast() = default;

    /// Posts one notification for immediate delivery; nobody listening is no error.
    virtual void post(std::string_view name, const PropertyDictionary& userInfo) = 0;
};

}  // namespace ventras
