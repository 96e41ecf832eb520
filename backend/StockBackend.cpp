#include "backend/StockBackend.h"

#include <cups/backend.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

namespace ventras {
namespace {

constexpr const char* kDeviceURI = "DEVICE_URI";

}  // namespace

std::optional<std::string> schedulerVariable(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? std::nullopt : std::optional<std::string>(value);
}

std::string jobDeviceURI(char* arguments[]) {
    return schedulerVariable(kDeviceURI).value_or(arguments[0]);
}

std::string schedulerProgram(const std::string& program) {
    return schedulerVariable("CUPS_SERVERBIN").value_or(VENTRAS_CUPS_SERVERBIN) + "/" + program;
}

int becomeStockBackend(const std::string& program, std::optional<std::string> uri, char* arguments[]) {
    if (uri) {
        arguments[0] = uri->data();
        setenv(kDeviceURI, uri->c_str(), 1);
    }
    const auto path = schedulerProgram(program);
    execv(path.c_str(), arguments);
    std::perror(("ERROR: Unable to start " + path).c_str());
    return CUPS_BACKEND_FAILED;
}

}  // namespace ventras
