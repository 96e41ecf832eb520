#pragma once

#include <cstddef>

namespace ventras {

/// How often this thread has asked for heap memory so far, whoever asked: the program, C++ or a C library.
/// Linking the .cpp file replaces malloc() for the whole program.
std::size_t allocationCount();

}  // namespace ventras
