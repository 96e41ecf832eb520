#include "bench/AllocationCount.h"

namespace {

thread_local std::size_t count = 0;

}  // namespace

// glibc lets a program replace its allocator, and keeps its own reachable under these names.
extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t number, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);

void* malloc(std::size_t size) {
    ++count;
    return __libc_malloc(size);
}

void* calloc(std::size_t number, std::size_t size) {
    ++count;
    return __libc_calloc(number, size);
}

void* realloc(void* block, std::size_t size) {
    ++count;
    return __libc_realloc(block, size);
}
}

namespace ventras {

std::size_t allocationCount() {
    return count;
}

}  // namespace ventras
