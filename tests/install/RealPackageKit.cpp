#include "tests/install/RealPackageKit.h"

#include "tests/platform-linux/PrivateBus.h"

namespace ventras {

RealPackageKit::RealPackageKit(const PackageRoot& root)
    : polkitd_({"/usr/lib/polkit-1/polkitd", "--no-debug"}),
      packagekitd_({"unshare", "--mount", "--propagation", "private", "sh", "-ec",
                    "mount -t tmpfs none /var/lib/PackageKit; mount -t tmpfs none /var/cache/PackageKit;"
                    "exec /usr/libexec/packagekitd --keep-environment --disable-timer --backend=apt"},
                   {.environment = root.environment()}) {
    waitForService("org.freedesktop.PolicyKit1", polkitd_);
    waitForService("org.freedesktop.PackageKit", packagekitd_);
}

}  // namespace ventras
