#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

#include "agent/VentrasController.h"
#include "drivers/PPDManager.h"
#include "platform/AuthorizationService.h"
#include "platform/Platform.h"
#include "platform/RunLoop.h"
#include "platform/linux/LinuxPlatform.h"
#include "queues/QueueLock.h"

namespace {

constexpr std::chrono::seconds kSlice{1};

int runAgent(ventras::Platform& platform, const std::vector<std::string>& arguments) {
    ventras::VentrasController controller(platform, ventras::PPDManager::defaultManager(platform));
    if (const auto result = controller.run(arguments); result != 0)
        return result;
    do {
        platform.runLoop.runUntil(ventras::Deadline::after(kSlice));
    } while (!controller.done());
    controller.updateMFPs();
    return static_cast<int>(static_cast<std::uint32_t>(controller.exitStatus()));
}

}  // namespace

int main(int argc, char* argv[]) {
    ventras::queueLock();
    ventras::LinuxPlatform linuxPlatform;
    auto& platform = linuxPlatform.platform();
    if (const auto status = platform.authorization.create("system.print.admin"); status != 0)
        return status;
    std::setvbuf(stdout, nullptr, _IONBF, 0);
    std::setvbuf(stderr, nullptr, _IONBF, 0);
    return runAgent(platform, {argv + 1, argv + argc});
}
