#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

#include "platform/UsbRegistry.h"

namespace ventras {

/// Every printer interface of a registry, in its order.
inline std::vector<std::unique_ptr<UsbInterfaceService>> allPrinters(UsbRegistry& registry) {
    std::vector<std::unique_ptr<UsbInterfaceService>> services;
    const auto iterator = registry.matchingInterfaces(kUsbPrinterInterfaces);
    while (auto service = registry.nextInterface(*iterator))
        services.push_back(std::move(service));
    return services;
}

inline std::unique_ptr<UsbInterfaceHandle> openFirstPrinter(UsbRegistry& registry) {
    return registry.openInterface(*allPrinters(registry).at(0));
}

/// Their devices' locations and their interface numbers.
inline std::vector<std::pair<std::uint32_t, int>> printerPlaces(UsbRegistry& registry) {
    std::vector<std::pair<std::uint32_t, int>> list;
    for (const auto& service : allPrinters(registry)) {
        const auto interface = registry.openInterface(*service);
        list.emplace_back(registry.interfaceLocation(*interface).value(),
                          registry.interfaceNumber(*interface).value());
    }
    return list;
}

/// GET_DEVICE_ID of interface 0 in its setting 0.
inline UsbControlRequest getDeviceID(std::uint16_t length, std::chrono::milliseconds wait) {
    UsbControlRequest request;
    request.bmRequestType = 0xA1;
    request.wLength = length;
    request.noDataTimeOut = wait;
    return request;
}

}  // namespace ventras
