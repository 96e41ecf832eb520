#pragma once

#include <functional>
#include <string>

#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// One object on a message bus whose calls a test answers itself, before or after it sends signals. It lives
/// on the thread of a BusThread.
class BusObject {
public:
    using Calls = std::function<void(const std::string& method, GVariant* arguments, GDBusMethodInvocation*)>;
    using Properties = std::function<GVariant*(const std::string& property)>;

    /// @param members of the interface, in the XML of D-Bus introspection
    BusObject(GDBusConnection* connection, std::string path, std::string interface,
              const std::string& members, Calls calls, Properties properties = {});
    BusObject(const BusObject&) = delete;
    BusObject& operator=(const BusObject&) = delete;

    /// Sends a signal of the object. @param arguments a floating tuple
    void emit(const char* signal, GVariant* arguments) const;

    /// Tells that a property has a new value, by the standard signal.
    void emitChanged(const char* property, GVariant* value) const;

private:
    GDBusConnection* connection_;
    std::string path_;
    std::string interface_;
    Calls calls_;
    Properties properties_;
};

/// Runs a function later, on the calling thread of a BusThread.
void later(unsigned milliseconds, std::function<void()> function);

}  // namespace ventras
