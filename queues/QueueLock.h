#pragma once

#include <mutex>

namespace ventras {

/// The one lock of the process around the creation of each queue: names are chosen, queues made and the
/// default printer set by one thread at a time. Made at the first call, which start-up makes before there are
/// threads.
std::mutex& queueLock();

}  // namespace ventras
