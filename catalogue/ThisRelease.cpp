#include "catalogue/ThisRelease.h"

#include "platform/linux/desktop/GObjectPtr.h"

namespace ventras {

std::string thisRelease() {
    const GTextPtr id{g_get_os_info(G_OS_INFO_KEY_ID)};
    const GTextPtr version{g_get_os_info(G_OS_INFO_KEY_VERSION_ID)};
    std::string release = id ? id.get() : "linux";
    return version ? release.append(" ").append(version.get()) : release;
}

}  // namespace ventras
