#include "ctl/Complaint.h"

#include <cstdio>

#include "ctl/Text.h"

namespace ventras {

void complain(std::string_view message) {
    std::fprintf(stderr, "ventrasctl: %s\n", textOf(message).c_str());
}

Exit usageError(std::string_view message) {
    complain(message);
    std::fputs("Try 'ventrasctl --help' for more information.\n", stderr);
    return Exit::Usage;
}

}  // namespace ventras
