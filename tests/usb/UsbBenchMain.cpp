#include <gtest/gtest.h>

#include <string_view>

#include "platform/linux/options/UsbOptionSelection.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/parts/UsbBench.h"

namespace {

// Asks one printer for its product in a process of its own, for the test that ends it meanwhile.
int askProduct(const char* uri) {
    ventras::FakeLog log;
    ventras::UsbOptionSelection selection(uri, log);
    return selection.autoSelectPPD();
}

}  // namespace

int main(int count, char** arguments) {
    ventras::UsbBench::enter(arguments);
    if (count == 3 && std::string_view(arguments[1]) == "--ask-product")
        return askProduct(arguments[2]);
    testing::InitGoogleTest(&count, arguments);
    return RUN_ALL_TESTS();
}
