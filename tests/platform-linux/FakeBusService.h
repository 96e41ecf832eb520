#pragma once

#include <functional>
#include <optional>
#include <string>

#include "tests/platform-linux/BusObject.h"
#include "tests/platform-linux/BusThread.h"

namespace ventras {

/// A service on the system bus of the environment: one object with one interface. It stands for programs that
/// cannot run in a test, such as a desktop's password prompt.
class FakeBusService {
public:
    /// Answers on a thread of the service's own.
    /// @param member a method's or a property's name
    /// @param arguments the method's, a tuple; null for a property
    /// @return the method's reply, a tuple, or the property's value; null = never answer
    using Handler = std::function<GVariant*(const std::string& member, GVariant* arguments)>;

    /// Returns when the service has its name.
    /// @param members of the interface, in the XML of D-Bus introspection
    FakeBusService(const std::string& name, const std::string& path, const std::string& interface,
                   const std::string& members, Handler handler);

private:
    Handler handler_;
    std::optional<BusObject> object_;
    BusThread thread_;
};

}  // namespace ventras
