#include "tests/soak/Census.h"

#include <chrono>
#include <csignal>
#include <filesystem>
#include <iterator>
#include <system_error>

#include "platform/IdleConnections.h"
#include "tests/parts/ComesTrue.h"

namespace ventras {
namespace {

namespace fs = std::filesystem;

std::set<std::string> openDescriptors() {
    std::set<std::string> descriptors;
    for (const auto& entry : fs::directory_iterator("/proc/self/fd")) {
        std::error_code gone;
        const auto target = fs::read_symlink(entry.path(), gone);
        if (!gone)
            descriptors.insert(entry.path().filename().string() + " = " + target.string());
    }
    return descriptors;
}

}  // namespace

Census Census::take() {
    IdleConnections::shared().take({});  // it lets go of the old ones when it is asked
    const fs::directory_iterator threads("/proc/self/task");
    return {openDescriptors(), static_cast<std::size_t>(std::distance(begin(threads), end(threads)))};
}

Census Census::takeWhenAtMost(const Census& other) {
    Census census;
    const auto isNoMore = [&] {
        census = take();
        return !census.exceeds(other);
    };
    comesTrue(isNoMore, std::chrono::seconds(4));
    return census;
}

std::string Census::excessOver(const Census& other) const {
    auto text = std::to_string(threads) + " threads instead of " + std::to_string(other.threads) + ", " +
                std::to_string(descriptors.size()) + " descriptors instead of " +
                std::to_string(other.descriptors.size());
    for (const auto& descriptor : descriptors)
        if (!other.descriptors.contains(descriptor))
            text += ", " + descriptor;
    return text;
}

bool isGroupAlive(pid_t group) {
    return kill(-group, 0) == 0;
}

}  // namespace ventras
