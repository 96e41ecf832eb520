#include <gtest/gtest.h>

#include <cstdlib>

#include "tests/parts/TemporaryFolder.h"
#include "tests/responder/OwnNetwork.h"

// The main() of every test program with a responder. The bus gets its address here because libdbus reads it
// once in a process's life.
int main(int argc, char* argv[]) {
    const std::vector<char*> arguments(argv, argv + argc + 1);
    testing::InitGoogleTest(&argc, argv);
    if (GTEST_FLAG_GET(list_tests))
        return RUN_ALL_TESTS();
    ventras::enterOwnNetwork(std::vector(arguments).data());
    const ventras::TemporaryFolder bus;
    setenv("DBUS_SYSTEM_BUS_ADDRESS", ("unix:path=" + (bus / "bus").string()).c_str(), 1);
    return RUN_ALL_TESTS();
}
