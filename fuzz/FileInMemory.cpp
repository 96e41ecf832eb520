#include "fuzz/FileInMemory.h"

#include <sys/mman.h>
#include <unistd.h>

#include "fuzz/Require.h"

namespace ventras {

FileInMemory::FileInMemory() : descriptor_(memfd_create("fuzz", MFD_CLOEXEC)) {
    require(descriptor_ >= 0);
}

FileInMemory::~FileInMemory() {
    close(descriptor_);
}

void FileInMemory::hold(std::string_view content) const {
    require(ftruncate(descriptor_, 0) == 0);
    require(pwrite(descriptor_, content.data(), content.size(), 0) == static_cast<ssize_t>(content.size()));
}

}  // namespace ventras
