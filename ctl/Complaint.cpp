#include "ctl/Complaint.h"

#include <cstdio>

#include "ctl/Text.h"
#include "ctl/Translation.h"

namespace ventras {

void complain(std::string_view message) {
    std::fprintf(stderr, "ventrasctl: %s\n", textOf(message).c_str());
}

Exit usageError(std::string_view message) {
    complain(message);
    std::fprintf(stderr, "%s\n", translated("Try 'ventrasctl --help' for more information.").c_str());
    return Exit::Usage;
}

}  // namespace ventras
