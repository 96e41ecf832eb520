#include <gmock/gmock.h>

#include "tests/parts/Program.h"

namespace ventras {
namespace {

using testing::HasSubstr;
using testing::Not;

// A run is short: what it does not need must not be loaded before it begins.
TEST(StartUp, LoadsOnlyTheLibrariesThatEveryRunNeeds) {
    // The system's loader then names them and starts nothing.
    const auto run = runProgram({"env", "LD_TRACE_LOADED_OBJECTS=1", VENTRAS_AGENT});
    EXPECT_THAT(run.standardOutput, HasSubstr("libcups.so"));
    for (const auto* late : {"libgio-", "libgobject-", "libcupsfilters.so"})
        EXPECT_THAT(run.standardOutput, Not(HasSubstr(late)));
}

}  // namespace
}  // namespace ventras
