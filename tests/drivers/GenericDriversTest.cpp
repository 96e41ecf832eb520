#include "drivers/GenericDrivers.h"

#include <gtest/gtest.h>

#include <thread>

#include "drivers/PPDManager.h"
#include "tests/drivers/PPDText.h"
#include "tests/fakes/FakePlatform.h"

namespace ventras {
namespace {

PPDRecord named(std::string name, std::string make = "Acme") {
    PPDRecord record;
    record.name = std::move(name);
    record.make = std::move(make);
    return record;
}

class GenericDriver : public testing::Test {
protected:
    /// What happens when a generic driver is asked for that is not there as it should.
    template <typename Ask>
    static std::string errorOf(Ask ask) {
        try {
            ask();
        } catch (const InternalInconsistencyError& error) {
            return error.what();
        }
        return "no error";
    }

    std::vector<PPDRecord> catalogue_;
    int asked_ = 0;
    FakeResources resources_;
    GenericDrivers drivers_{resources_, [this] {
                                ++asked_;
                                return catalogue_;
                            }};
};

TEST_F(GenericDriver, ForPostscriptIsTheSchedulersWhateverItsCase) {
    catalogue_ = {named("drv:///sample.drv/generpcl.ppd"), named("DRV:///Sample.drv/GENERIC.ppd", "first"),
                  named("drv:///sample.drv/generic.ppd", "second")};
    EXPECT_EQ(drivers_.postscript(), catalogue_[1]);
}

TEST_F(GenericDriver, ForPostscriptIsThePrintSystemsOwnOtherwise) {
    catalogue_ = {named("drv:///sample.drv/generic.ppd.gz"), PPDRecord{}};
    EXPECT_EQ(drivers_.postscript().name, resources_.folder / "Generic.ppd");
}

TEST_F(GenericDriver, ForPCLIsTheSchedulersOrAnEmptyRecord) {
    catalogue_ = {named("drv:///sample.drv/generic.ppd"), named("drv:///SAMPLE.drv/generpcl.ppd")};
    EXPECT_EQ(drivers_.pcl(), catalogue_[1]);

    GenericDrivers without{resources_, [] { return std::vector<PPDRecord>{}; }};
    EXPECT_EQ(without.pcl(), PPDRecord{});
}

TEST_F(GenericDriver, ForFaxAndURFIsThePrintSystemsOwnWithoutTheScheduler) {
    catalogue_ = {named("drv:///sample.drv/Fax.ppd"), named("drv:///sample.drv/Vellum.ppd")};
    EXPECT_EQ(drivers_.fax().name, resources_.folder / "Fax.ppd");
    EXPECT_EQ(drivers_.urf().name, resources_.folder / "Vellum.ppd");
    EXPECT_EQ(asked_, 0);
}

TEST_F(GenericDriver, IsLookedUpOnceEvenWhenNothingWasFound) {
    EXPECT_EQ(drivers_.pcl(), PPDRecord{});
    catalogue_ = {named("drv:///sample.drv/generpcl.ppd"), named("drv:///sample.drv/generic.ppd")};
    EXPECT_EQ(drivers_.pcl(), PPDRecord{});
    EXPECT_EQ(asked_, 1);

    EXPECT_EQ(drivers_.postscript(), catalogue_[1]);
    catalogue_.clear();
    EXPECT_EQ(drivers_.postscript().name, "drv:///sample.drv/generic.ppd");
    EXPECT_EQ(asked_, 2);

    const auto urf = drivers_.urf();
    resources_.folder = "/nonexistent";
    EXPECT_EQ(drivers_.urf(), urf);
}

TEST_F(GenericDriver, IsACopyThatMayBeChanged) {
    const auto original = drivers_.urf();
    auto copy = drivers_.urf();
    copy.product.clear();
    copy.name = "x";
    EXPECT_EQ(drivers_.urf(), original);
}

TEST_F(GenericDriver, ThatIsMissingIsABrokenInstallation) {
    resources_.folder = "/nonexistent";
    EXPECT_EQ(errorOf([&] { drivers_.urf(); }), "Vellum PPD missing from 'TestResources' bundle");
    EXPECT_EQ(errorOf([&] { drivers_.fax(); }), "Fax PPD missing from 'TestResources' bundle");
    EXPECT_EQ(errorOf([&] { drivers_.postscript(); }), "Generic PPD missing from 'TestResources' bundle");
    EXPECT_EQ(errorOf([&] { drivers_.system("Other"); }), "Other PPD missing from 'TestResources' bundle");
}

TEST_F(GenericDriver, ThatDoesNotParseIsABrokenInstallation) {
    const TemporaryFolder folder;
    folder.write("Vellum.ppd", "");
    folder.write("Fax.ppd", "hello\n");
    folder.write("Generic.ppd", "*PPD-Adobe: \"3.0\"\n");
    resources_.folder = folder.path();
    EXPECT_EQ(errorOf([&] { drivers_.urf(); }), "Unable to parse Vellum ppd.");
    EXPECT_EQ(errorOf([&] { drivers_.fax(); }), "Unable to parse Fax ppd.");
    EXPECT_EQ(errorOf([&] { drivers_.postscript(); }), "Unable to parse Generic ppd.");
}

TEST_F(GenericDriver, IsTheSameForAllThreads) {
    catalogue_ = {named("drv:///sample.drv/generpcl.ppd")};
    {
        std::vector<std::jthread> threads;
        for (int i = 0; i < 8; ++i)
            threads.emplace_back([&] {
                EXPECT_EQ(drivers_.pcl(), catalogue_[0]);
                EXPECT_EQ(drivers_.urf().name, resources_.folder / "Vellum.ppd");
            });
    }
    EXPECT_EQ(asked_, 1);
}

TEST(PPDManagerFace, GivesTheGenericDriversOfItsPlatform) {
    FakePlatform fakes;
    PPDManager manager(fakes.platform);
    EXPECT_EQ(manager.genericURFPPD().name, fakes.resources.folder / "Vellum.ppd");
    EXPECT_EQ(manager.genericFaxPPD().name, fakes.resources.folder / "Fax.ppd");
    EXPECT_EQ(manager.genericSystemPPD("Generic").name, fakes.resources.folder / "Generic.ppd");
    EXPECT_THROW(static_cast<void>(manager.genericSystemPPD("vellum")), InternalInconsistencyError);
}

TEST(PPDManagerFace, HasNoListsByType) {
    FakePlatform fakes;
    const PPDManager manager(fakes.platform);
    for (const auto* type : {"fax", "raster", "postscript", "other", ""})
        EXPECT_EQ(manager.ppdsOfType(type), std::nullopt) << type;
    EXPECT_EQ(manager.faxPPDs(), std::nullopt);
    EXPECT_EQ(manager.rasterPPDs(), std::nullopt);
    EXPECT_EQ(manager.postscriptPPDs(), std::nullopt);
}

TEST(PPDManagerFace, IsOneForTheProcess) {
    static FakePlatform first, second;
    EXPECT_EQ(&PPDManager::defaultManager(first.platform), &PPDManager::defaultManager(second.platform));
}

}  // namespace
}  // namespace ventras
