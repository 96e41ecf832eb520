#include "tests/parts/OpenedPpd.h"

#include <cups/ppd.h>

#include "tests/parts/TemporaryFolder.h"

namespace ventras {

PpdPtr openedPpd(std::string_view text) {
    const TemporaryFolder folder;
    return PpdPtr{ppdOpenFile(folder.write("a.ppd", text).c_str())};
}

}  // namespace ventras
