#include "agent/SeenPrinters.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/devices/FakeDevice.h"
#include "tests/fakes/FakePlatform.h"
#include "tests/fakes/PropertyValuePrinter.h"

namespace ventras {
namespace {

class Seen : public testing::Test {
protected:
    PropertyValue stored() const { return preferences_.settings.back().value; }

    FakePreferences preferences_;
    SeenPrinters seen_{preferences_};
    FakeDevice a_{"one", "A"}, alsoA_{"two", "A"}, lowerCaseA_{"one", "a"}, b_{"one", "B"}, empty_{"one", ""},
        without_{"one"};
};

TEST_F(Seen, ContainsNoDeviceAtFirst) {
    EXPECT_FALSE(seen_.contains(a_));
    EXPECT_FALSE(seen_.contains(empty_));
    EXPECT_EQ(preferences_.settings.size(), 0U);
}

TEST_F(Seen, ContainsADeviceWithoutAScanIDAndStoresNothingForIt) {
    EXPECT_TRUE(seen_.contains(without_));
    seen_.insert(without_);
    EXPECT_EQ(preferences_.settings.size(), 0U);
}

TEST_F(Seen, ContainsWhatWasRecordedByItsExactScanID) {
    seen_.insert(a_);
    EXPECT_TRUE(seen_.contains(a_));
    EXPECT_TRUE(seen_.contains(alsoA_));
    EXPECT_FALSE(seen_.contains(lowerCaseA_));
    EXPECT_FALSE(seen_.contains(b_));
}

TEST_F(Seen, StoresTheWholeMemoryEachTime) {
    seen_.insert(b_);
    EXPECT_EQ(stored(), PropertyValue(PropertyArray{"B"}));
    seen_.insert(a_);
    EXPECT_EQ(stored(), PropertyValue(PropertyArray{"A", "B"}));
    ASSERT_EQ(preferences_.settings.size(), 2U);
    EXPECT_EQ(preferences_.settings[0].domain, "com.quillon.print.ventrasagent");
    EXPECT_EQ(preferences_.settings[0].key, "Printers Seen");
}

TEST_F(Seen, StoresAnIDOnceHoweverOftenItIsRecorded) {
    seen_.insert(a_);
    seen_.insert(alsoA_);
    EXPECT_EQ(stored(), PropertyValue(PropertyArray{"A"}));
}

}  // namespace
}  // namespace ventras
