#include <malloc.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>
#include <thread>
#include <vector>

#include "agent/CommandLine.h"
#include "agent/VentrasController.h"
#include "drivers/PPDManager.h"
#include "platform/Alarm.h"
#include "platform/AuthorizationService.h"
#include "platform/Platform.h"
#include "platform/RunLoop.h"
#include "platform/linux/LinuxPlatform.h"
#include "platform/linux/options/DriverlessPpd.h"
#include "queues/QueueLock.h"

namespace {

constexpr std::chrono::seconds kSlice{1};

// The workers wait for networks, not for each other's memory: a few heaps do for all of them. Each begins
// with what a run needs, which it would else get page by page.
void prepareHeaps() {
    constexpr int kHeaps = 4;
    constexpr int kBeginning = 1 << 20;
    mallopt(M_ARENA_MAX, kHeaps);
    mallopt(M_TOP_PAD, kBeginning);
}

// What the drivers of IPP printers are made with takes long to load; that happens while the printers are
// asked what they are.
std::jthread loaderFor(const std::vector<std::string>& arguments) {
    const auto isIpp = [](const std::string& argument) {
        return ventras::parseArgument(argument).kind == ventras::ArgumentKind::NetworkURI;
    };
    return std::ranges::any_of(arguments, isIpp) ? ventras::loadPPDGenerator() : std::jthread();
}

int runAgent(ventras::Platform& platform, const std::vector<std::string>& arguments) {
    ventras::VentrasController controller(platform, ventras::PPDManager::defaultManager(platform));
    ventras::Alarm::startThread();
    if (const auto result = controller.run(arguments); result != 0)
        return result;
    const auto loader = loaderFor(arguments);  // the workers have been started
    do {
        platform.runLoop.runUntil(ventras::Deadline::after(kSlice));
    } while (!controller.done());
    controller.updateMFPs();
    return static_cast<int>(static_cast<std::uint32_t>(controller.exitStatus()));
}

}  // namespace

int main(int argc, char* argv[]) {
    prepareHeaps();
    ventras::queueLock();
    ventras::LinuxPlatform linuxPlatform;
    auto& platform = linuxPlatform.platform();
    if (const auto status = platform.authorization.create("system.print.admin"); status != 0)
        return status;
    std::setvbuf(stdout, nullptr, _IONBF, 0);
    std::setvbuf(stderr, nullptr, _IONBF, 0);
    return runAgent(platform, {argv + 1, argv + argc});
}
