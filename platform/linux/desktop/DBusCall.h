#pragma once

#include <chrono>
#include <string>

#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

/// One of the two well-known message buses.
enum class Bus { System, Session };

/// A method of an object on a message bus (D-Bus specification). The texts are literals.
struct DBusMethod {
    Bus bus;
    const char* service;
    const char* path;
    const char* interface;
    const char* name;
};

/// What may happen during a call.
enum class DBusCallMode {
    Plain,         ///< a service that can be started by the bus is started
    RunningOnly,   ///< never starts a service
    MayAskTheUser  ///< the service may ask the user to authorise the call
};

/// What came of a D-Bus call.
struct DBusAnswer {
    VariantPtr reply;     ///< empty = the call failed
    std::string failure;  ///< why, for people
};

/// Calls a method over a connection of its own and waits for its answer. Any thread may call; the calling
/// thread blocks for at most `limit`, connecting included.
/// @param arguments a tuple; a floating reference is consumed
/// @param replyType of the tuple that comes back; another type is a failure
DBusAnswer callDBus(const DBusMethod& method, GVariant* arguments, const char* replyType,
                    std::chrono::milliseconds limit, DBusCallMode mode = DBusCallMode::Plain);

/// A signal that an object sends.
struct DBusSignal {
    Bus bus;
    const char* path;
    const char* interface;
    const char* name;
};

/// Sends a signal to whoever listens, and waits until it has left the process, at most `limit`.
/// @return why it could not be sent; empty on success.
std::string emitDBusSignal(const DBusSignal& signal, GVariant* arguments, std::chrono::milliseconds limit);

}  // namespace ventras
