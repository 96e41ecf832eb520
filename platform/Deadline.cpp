#include "platform/Deadline.h"

#include <algorithm>

namespace ventras {

std::chrono::milliseconds Deadline::remaining() const {
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(moment_ - Clock::now());
    return std::max(left, std::chrono::milliseconds::zero());
}

}  // namespace ventras
