#pragma once

#include "tests/install/PackageRoot.h"
#include "tests/parts/Program.h"

namespace ventras {

/// A real packagekitd, with a real polkitd, on the system bus of the environment, over the packages of a
/// PackageRoot. Needs root, to keep what it writes in a mount namespace of its own.
class RealPackageKit {
public:
    /// Returns when it has its name.
    explicit RealPackageKit(const PackageRoot& root);

private:
    RunningProgram polkitd_;
    RunningProgram packagekitd_;
};

}  // namespace ventras
