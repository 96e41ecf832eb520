#pragma once

namespace ventras {

/// Moves the test program into a network, and a view of the file system, of its own, where a DNS-SD responder
/// can run without meeting anybody else's: runs the program anew in fresh namespaces when it is not in them
/// yet.
///
/// Where the system gives none, root stays in place, and programs that do so run one after the other.
/// Call it first thing in main(), with main()'s arguments as they came.
/// @throw std::runtime_error when there is no way to do it.
void enterOwnNetwork(char* arguments[]);

}  // namespace ventras
