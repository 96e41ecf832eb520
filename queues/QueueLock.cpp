#include "queues/QueueLock.h"

namespace ventras {

std::mutex& queueLock() {
    static auto& lock = *new std::mutex;  // never freed: a worker may still hold it while the process ends
    return lock;
}

}  // namespace ventras
