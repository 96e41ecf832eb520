#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>

#include "tests/catalogue/CatalogueTexts.h"
#include "tests/install/FakePackageKit.h"
#include "tests/install/InstallRun.h"
#include "tests/parts/TemporaryFolder.h"
#include "tests/platform-linux/PrivateBus.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::IsEmpty;
using Clock = std::chrono::steady_clock;

const std::string kLaserJet = "MANUFACTURER:HP;MODEL:LaserJet 4";

// What becomes of an install when the other side is not what it should be; time limits are short here.
class InstallFault : public testing::Test {
protected:
    InstallFault() { folder_.write("catalogue", smallCatalogue()); }

    std::string install(InstallLimits limits = shortLimits()) {
        return InstallRun(folder_ / "catalogue", &person_, limits).install({kLaserJet});
    }

    TemporaryFolder folder_;
    Person person_;
};

void stayCalm(FakeTransaction&) {}

TEST_F(InstallFault, OfAMissingBus) {
    ASSERT_EQ(setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent/bus", 1), 0);
    EXPECT_EQ(install(), "failed 106");
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(InstallFault, OfAMissingPackageKit) {
    const PrivateBus bus;
    EXPECT_EQ(install(), "failed 106");
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(InstallFault, OfABusThatHangs) {
    PrivateBus bus;
    bus.suspend();
    EXPECT_EQ(install(), "failed 106");
    bus.resume();
}

TEST_F(InstallFault, OfALookUpThatHangsIsCancelled) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"}, {{"Resolve", stayCalm}});
    const auto start = Clock::now();
    EXPECT_EQ(install(), "failed 107");
    EXPECT_LT(Clock::now() - start, 8s);
    EXPECT_TRUE(packageKit.was("Cancel"));
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(InstallFault, OfAnInstallThatHangsIsCancelledWhereThatIsAllowed) {
    const PrivateBus bus;
    FakeTransaction* running = nullptr;
    FakePackageKit packageKit({"laser-driver"},
                              {{"Install", [&](FakeTransaction& transaction) { running = &transaction; }},
                               {"Cancel", [&](FakeTransaction&) { running->finish(3); }}});
    EXPECT_EQ(install(), "failed 107");
    EXPECT_TRUE(packageKit.was("Cancel"));
}

TEST_F(InstallFault, OfAnInstallThatHangsIsNeverCancelledWhereThatIsForbidden) {
    const PrivateBus bus;
    FakePackageKit packageKit(
        {"laser-driver"}, {{"Install", [](FakeTransaction& transaction) { transaction.forbidCancel(); }}});
    EXPECT_EQ(install(), "failed 107");
    EXPECT_FALSE(packageKit.was("Cancel"));
    EXPECT_FALSE(packageKit.was("Remove"));
}

TEST_F(InstallFault, IsNoneWhenASlowInstallMoves) {
    const PrivateBus bus;
    FakePackageKit packageKit(
        {"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                transaction.forbidCancel();
                                for (const unsigned step : {1U, 2U, 3U, 4U, 5U})
                                    later(step * 200, [&transaction, step] { transaction.progress(step); });
                                later(1100, [&transaction] {
                                    transaction.error(46);
                                    transaction.finish(2);
                                });
                            }}});
    EXPECT_EQ(install(), "failed 46");
    EXPECT_FALSE(packageKit.was("Cancel"));
}

TEST_F(InstallFault, OfAnInstallThatMovesForEverEndsAllTheSame) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"},
                              {{"Install", [](FakeTransaction& transaction) {
                                    transaction.forbidCancel();
                                    for (unsigned i = 1; i < 20; ++i)
                                        later(i * 150, [&transaction, i] { transaction.progress(i); });
                                }}});
    EXPECT_EQ(install(), "failed 107");
    EXPECT_FALSE(packageKit.was("Cancel"));
}

TEST_F(InstallFault, IsNoneWhenACancellationComesTooLate) {
    const PrivateBus bus;
    FakeTransaction* running = nullptr;
    FakePackageKit packageKit({"laser-driver"},
                              {{"Install", [&](FakeTransaction& transaction) { running = &transaction; }},
                               {"Cancel", [&](FakeTransaction&) { running->finish(1); }}});
    EXPECT_EQ(install(), "failed 108");  // said to be done; it was looked for then
}

TEST_F(InstallFault, OfAPackageKitThatGoesAway) {
    const PrivateBus bus;
    FakePackageKit* self = nullptr;
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [&](FakeTransaction&) { self->goAway(); }}});
    self = &packageKit;
    EXPECT_EQ(install(), "failed 109");
}

TEST_F(InstallFault, OfABusThatGoesAway) {
    PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"});
    person_.whileThinking = [&] { bus.stop(); };
    EXPECT_EQ(install(), "failed 106");
}

TEST_F(InstallFault, OfATransactionThatIsDestroyed) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                                      transaction.object().emit("Destroy",
                                                                                g_variant_new("()"));
                                                  }}});
    EXPECT_EQ(install(), "failed 109");
}

TEST_F(InstallFault, OfNonsenseIsAsIfNothingHadBeenSaid) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                                      const auto& object = transaction.object();
                                                      object.emit("Finished", g_variant_new("(s)", "1"));
                                                      object.emit("Finished", g_variant_new("()"));
                                                      object.emit("ErrorCode", g_variant_new("(ii)", 1, 2));
                                                      object.emit("Package", g_variant_new("(u)", 1U));
                                                      object.emit("Unknown", g_variant_new("(s)", "x"));
                                                      object.emitChanged("Percentage",
                                                                         g_variant_new_string("x"));
                                                      object.emitChanged("Status", g_variant_new_double(1));
                                                      transaction.finish(2);
                                                      transaction.finish(1);
                                                  }}});
    EXPECT_EQ(install(), "failed 100");
}

TEST_F(InstallFault, OfAThousandPackagesThatNobodyAskedFor) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"}, {{"Resolve", [](FakeTransaction& transaction) {
                                                      for (int i = 0; i < 12'000; ++i)
                                                          transaction.package(
                                                              2, "p" + std::to_string(i) + ";1;all;x");
                                                      transaction.finish(1);
                                                  }}});
    EXPECT_EQ(install({}), "failed 105");
}

// Another process than PackageKit says that all went well.
TEST_F(InstallFault, IsNotHiddenByForgedSignals) {
    const PrivateBus bus;
    FakePackageKit packageKit({"laser-driver"}, {{"Install", stayCalm}});
    std::unique_ptr<BusThread> forger;
    person_.whileThinking = [&] {
        forger = std::make_unique<BusThread>([](GDBusConnection* connection) {
            for (unsigned i = 1; i < 10; ++i)
                later(i * 20, [connection] {
                    for (const char* path : {"/0_fake", "/1_fake", "/2_fake", "/3_fake"})
                        g_dbus_connection_emit_signal(connection, nullptr, path,
                                                      "org.freedesktop.PackageKit.Transaction", "Finished",
                                                      g_variant_new("(uu)", 1U, 1U), nullptr);
                });
        });
    };
    EXPECT_EQ(install(), "failed 107");
}

}  // namespace
}  // namespace ventras
