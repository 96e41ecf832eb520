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
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using Clock = std::chrono::steady_clock;

const std::string kLaserJet = "MANUFACTURER:HP;MODEL:LaserJet 4";
const std::string kStylus = "MANUFACTURER:EPSON;MODEL:Stylus C80";
const std::string kID = "laser-driver;1.0;all;repository";

// The installer of the platform, with a person of the test's, over PackageKit of the test's.
class Install : public testing::Test {
protected:
    Install() { folder_.write("catalogue", smallCatalogue()); }

    std::filesystem::path catalogue() const { return folder_ / "catalogue"; }

    TemporaryFolder folder_;
    PrivateBus bus_;
    Person person_;
};

TEST_F(Install, AsksAndInstallsAndLooksWhetherThePackageIsThere) {
    FakePackageKit packageKit({"laser-driver", "ink-driver"});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "completed");
    EXPECT_THAT(packageKit.calls(), ElementsAre("Resolve laser-driver", "Simulate " + kID, "Install " + kID,
                                                "Resolve laser-driver"));
    EXPECT_TRUE(packageKit.isInstalled("laser-driver"));
    EXPECT_FALSE(packageKit.isInstalled("ink-driver"));
    ASSERT_EQ(person_.questions.size(), 1U);
}

TEST_F(Install, TellsWhatItWouldInstallForWhichDevice) {
    FakePackageKit packageKit({"laser-driver"});
    InstallRun(catalogue(), &person_).install({kLaserJet});
    const auto& question = person_.questions.at(0);
    EXPECT_EQ(question.title, "Would you like to download and install software for 'Laser'?");
    EXPECT_EQ(question.body, "A driver (laser-driver 1.0)\nHP LaserJet 4");
    EXPECT_EQ(question.yes, "Install");
    EXPECT_EQ(question.no, "Not Now");
    EXPECT_EQ(question.icon, "printer");
}

TEST_F(Install, AsksOnceForThePackagesOfSeveralDevices) {
    FakePackageKit packageKit({"laser-driver", "ink-driver"});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet, kStylus}), "completed");
    ASSERT_EQ(person_.questions.size(), 1U);
    EXPECT_THAT(person_.questions[0].body, AllOf(HasSubstr("laser-driver 1.0"), HasSubstr("ink-driver 1.0"),
                                                 HasSubstr("HP LaserJet 4"), HasSubstr("EPSON Stylus C80")));
    EXPECT_TRUE(packageKit.isInstalled("laser-driver"));
    EXPECT_TRUE(packageKit.isInstalled("ink-driver"));
}

TEST_F(Install, IsOnlyDoneAfterAYes) {
    for (const auto answer : {PromptAnswer::No, PromptAnswer::Unanswered, PromptAnswer::NotAsked}) {
        FakePackageKit packageKit({"laser-driver"});
        person_.answer = answer;
        InstallRun run(catalogue(), &person_);
        EXPECT_EQ(run.install({kLaserJet}), "cancelled");
        EXPECT_FALSE(packageKit.was("Install")) << static_cast<int>(answer);
        EXPECT_THAT(run.log().lines(), ElementsAre(HasSubstr("no driver package is installed for")));
    }
}

TEST_F(Install, NeverAllowsUntrustedPackages) {
    FakePackageKit packageKit({"laser-driver"});
    InstallRun(catalogue(), &person_).install({kLaserJet});
    EXPECT_FALSE(packageKit.was("Untrusted"));
}

TEST_F(Install, AsksNobodyWhenEverythingIsThereAlready) {
    FakePackageKit packageKit({"+laser-driver"});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "completed");
    EXPECT_THAT(person_.questions, IsEmpty());
    EXPECT_THAT(packageKit.calls(), ElementsAre("Resolve laser-driver"));
}

TEST_F(Install, BringsAnInstalledPackageUpToDate) {
    bool isUpdated = false;
    FakePackageKit packageKit({"+laser-driver"}, {{"Resolve",
                                                   [&](FakeTransaction& transaction) {
                                                       transaction.package(1,
                                                                           "laser-driver;1.0;all;installed");
                                                       if (isUpdated)
                                                           transaction.package(1, "laser-driver;2.0;all;x");
                                                       else
                                                           transaction.package(2, "laser-driver;2.0;all;x");
                                                       transaction.finish(1);
                                                   }},
                                                  {"Install", [&](FakeTransaction& transaction) {
                                                       isUpdated = true;
                                                       transaction.finish(1);
                                                   }}});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "completed");
    EXPECT_THAT(person_.questions.at(0).body, HasSubstr("laser-driver 2.0"));
}

struct PredicateCase {
    const char* name;
    std::string predicate, end;
};
const PredicateCase kPredicates[] = {
    {"empty", "", "failed 101"},
    {"no condition", "printing software", "failed 101"},
    {"not closed", "(\"printing software\" in tags", "failed 101"},
    {"more than one", "(\"a\" in tags) (\"b\" in tags)", "failed 101"},
    {"every package", "\"printing software\" in tags", "failed 102"},
    {"any kind or device", "\"printing software\" in tags OR \"" + kLaserJet + "\" in tags", "failed 102"},
    {"no package", "\"MANUFACTURER:A;MODEL:B\" in tags", "failed 104"},
    {"wrong model", "\"printing software\" in tags AND \"MANUFACTURER:HP;MODEL:LaserJet 44\" in tags",
     "failed 104"},
    {"deep", std::string(100'000, '(') + "\"a\" in tags" + std::string(100'000, ')'), "failed 101"},
};

TEST_F(Install, RefusesPredicatesThatSelectNothingOrEverything) {
    FakePackageKit packageKit({"laser-driver"});
    for (const auto& [name, predicate, end] : kPredicates)
        EXPECT_EQ(InstallRun(catalogue(), &person_).installPredicate(predicate), end) << name;
    EXPECT_THAT(packageKit.calls(), IsEmpty());
    EXPECT_THAT(person_.questions, IsEmpty());
}

const PredicateCase kIDs[] = {
    {"a quotation mark", "MANUFACTURER:HP;MODEL:Laser\"Jet 4", "failed 101"},
    {"a predicate", "a\" IN tags) OR (\"printing software\" in tags) OR (\"b", "failed 102"},
    {"half a predicate", "a\" IN tags OR \"printing software\" in tags OR \"b", "failed 102"},
    {"parentheses", "MANUFACTURER:HP;MODEL:LaserJet (4) ((", "failed 104"},
    {"a closing one", ")", "failed 102"},
    {"10,000 characters", "MANUFACTURER:HP;MODEL:" + std::string(10'000, 'x'), "failed 104"},
    {"10,000 quotation marks", std::string(10'000, '"'), "failed 101"},
    {"a NUL", std::string("MANUFACTURER:HP;MODEL:LaserJet 4\0", 33), "failed 104"},
    {"a format", "%@ %s %n", "failed 102"},
    {"a package's name", "laser-driver", "failed 102"},
};

TEST_F(Install, IsNotMisledByWhatDevicesSay) {
    FakePackageKit packageKit({"laser-driver", "ink-driver", "collection"});
    for (const auto& [name, id, end] : kIDs)
        EXPECT_EQ(InstallRun(catalogue(), &person_).install({id}), end) << name;
    EXPECT_THAT(packageKit.calls(), IsEmpty());
    EXPECT_THAT(person_.questions, IsEmpty());
}

TEST_F(Install, FailsWithoutAUsableCatalogue) {
    FakePackageKit packageKit({"laser-driver"});
    const auto good = smallCatalogue();
    const std::string contents[] = {
        "",
        good.substr(0, good.size() / 2),
        "no property list",
        "bplist00" + good,
        std::string(5'000'000, ' '),
        textOf(catalogueContent({{"--root=/", packageEntry(0, {kLaserJet})}})),
        textOf(catalogueContent({{"../laser-driver", packageEntry(0, {kLaserJet})}})),
        textOf(catalogueContent({{"laser-driver;1.0", packageEntry(0, {kLaserJet})}}))};
    for (const auto& content : contents) {
        folder_.write("catalogue", content);
        InstallRun run(catalogue(), &person_);
        EXPECT_EQ(run.install({kLaserJet}), "failed 103") << content.substr(0, 500);
        EXPECT_THAT(run.log().lines(), ElementsAre(HasSubstr(kLaserJet)));
    }
    EXPECT_EQ(InstallRun(folder_ / "nowhere", &person_).install({kLaserJet}), "failed 103");
    EXPECT_THAT(packageKit.calls(), IsEmpty());
}

TEST_F(Install, TakesTheCatalogueOfAnotherReleaseWhereThePackageManagerKnowsThePackage) {
    folder_.write("catalogue", smallCatalogue("debian 99"));
    FakePackageKit packageKit({"laser-driver"});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "completed");
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kStylus}), "failed 105");
}

TEST_F(Install, FailsWhereThePackageManagerAnswersWithOtherPackages) {
    const std::string answers[] = {"laser-driver-evil;1.0;all;x",
                                   "Laser-driver;1.0;all;x",
                                   "laser-driver",
                                   "laser-driver;1.0;all",
                                   ";1.0;all;x",
                                   "laser-driver;1;2;3;4",
                                   "laser-driver;1.0\n;all;x",
                                   std::string(3000, 'x') + ";1;a;b"};
    for (const auto& id : answers) {
        FakePackageKit packageKit({"laser-driver"}, {{"Resolve", [&](FakeTransaction& transaction) {
                                                          transaction.package(2, id);
                                                          transaction.finish(1);
                                                      }}});
        EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "failed 105") << id;
        EXPECT_FALSE(packageKit.was("Install")) << id;
    }
    EXPECT_THAT(person_.questions, IsEmpty());
}

struct PlanCase {
    const char* name;
    unsigned info;
    const char* end;
};
constexpr PlanCase kPlans[] = {
    {"untrusted", 23, "failed 50"},
    {"another package removed", 13, "failed 110"},
    {"another package obsoleted", 15, "failed 110"},
    {"another package made older", 20, "failed 110"},
    {"another package updated", 11, "completed"},
    {"another package installed", 12, "completed"},
};

TEST_F(Install, AsksForNothingThatWouldDoHarm) {
    for (const auto& [name, info, end] : kPlans) {
        FakePackageKit packageKit({"laser-driver"},
                                  {{"Simulate", [info = info](FakeTransaction& transaction) {
                                        transaction.package(12, kID);
                                        transaction.package(info, "libother;2.0;amd64;repository");
                                        transaction.finish(1);
                                    }}});
        person_.questions.clear();
        EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), end) << name;
        EXPECT_EQ(person_.questions.size(), std::string_view(end) == "completed" ? 1U : 0U) << name;
    }
}

struct EndCase {
    unsigned exit, error;
    const char* end;
};
constexpr EndCase kEnds[] = {
    {2, 2, "failed 2"},    // no network
    {2, 10, "failed 10"},  // download failed
    {2, 13, "failed 13"},  // unmet dependency
    {2, 26, "failed 26"},  // locked
    {2, 46, "failed 46"},  // disk full
    {2, 48, "failed 48"},  // not authorised
    {8, 50, "failed 50"},  // not trusted
    {8, 0, "failed 50"},   // not trusted, without a reason
    {2, 0, "failed 100"},  // no reason
    {2, 1, "failed 100"},  // would be taken for another status
    {2, 4711, "failed 100"}, {0, 0, "failed 100"}, {99, 0, "failed 100"},
    {3, 17, "cancelled"},    {9, 65, "cancelled"},
};

TEST_F(Install, EndsAsPackageKitSays) {
    for (const auto& [exit, error, end] : kEnds) {
        FakePackageKit packageKit({"laser-driver"},
                                  {{"Install", [exit = exit, error = error](FakeTransaction& transaction) {
                                        if (error != 0)
                                            transaction.error(error);
                                        transaction.finish(exit);
                                    }}});
        EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), end)
            << "exit " << exit << ", error " << error;
        EXPECT_FALSE(packageKit.was("Remove")) << "exit " << exit << ", error " << error;
    }
}

TEST_F(Install, FailsWhenThePackageIsNotThereAfterwards) {
    FakePackageKit packageKit({"laser-driver"},
                              {{"Install", [](FakeTransaction& transaction) { transaction.finish(1); }}});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "failed 108");
}

TEST_F(Install, TakesAwayWhatIsLeftHalfInstalled) {
    for (const unsigned error : {16U, 56U, 58U}) {
        FakePackageKit packageKit({"laser-driver", "libneeded"},
                                  {{"Simulate",
                                    [](FakeTransaction& transaction) {
                                        transaction.package(12, "libneeded;1.0;all;repository");
                                        transaction.package(12, kID);
                                        transaction.package(11, "libupdated;1.0;all;repository");
                                        transaction.finish(1);
                                    }},
                                   {"Install", [error](FakeTransaction& transaction) {
                                        transaction.error(error);
                                        transaction.finish(2);
                                    }}});
        EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "failed " + std::to_string(error));
        EXPECT_EQ(packageKit.calls().back(),
                  "Remove libneeded;1.0;all;installed laser-driver;1.0;all;installed");
    }
}

TEST_F(Install, TakesAwayWhatSomebodyElsesCancellationLeaves) {
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                                      transaction.forbidCancel();
                                                      transaction.finish(3);
                                                  }}});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "cancelled");
    EXPECT_EQ(packageKit.calls().back(), "Remove laser-driver;1.0;all;installed");
}

TEST_F(Install, SaysWhenItMayNotTakeThatAway) {
    FakePackageKit packageKit({"laser-driver"}, {{"Install",
                                                  [](FakeTransaction& transaction) {
                                                      transaction.error(16);
                                                      transaction.finish(2);
                                                  }},
                                                 {"Remove", [](FakeTransaction& transaction) {
                                                      transaction.error(48, "not allowed");
                                                      transaction.finish(2);
                                                  }}});
    InstallRun run(catalogue(), &person_);
    EXPECT_EQ(run.install({kLaserJet}), "failed 16");
    EXPECT_THAT(run.log().lines(), ElementsAre(HasSubstr("could not be removed: not allowed")));
}

TEST_F(Install, LeavesWhatIsEntirelyInstalledWhenAnotherPackageFails) {
    int asked = 0;
    FakePackageKit packageKit({"laser-driver"}, {{"Install",
                                                  [&](FakeTransaction& transaction) {
                                                      transaction.error(16);
                                                      transaction.finish(2);
                                                  }},
                                                 {"Resolve", [&](FakeTransaction& transaction) {
                                                      transaction.package(asked++ == 0 ? 2 : 1, kID);
                                                      transaction.finish(1);
                                                  }}});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "failed 16");
    EXPECT_FALSE(packageKit.was("Remove"));
}

TEST_F(Install, ShowsHowFarItIs) {
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                                      transaction.progress(30);
                                                      transaction.progress(30);
                                                      transaction.progress(101);
                                                      transaction.progress(90);
                                                      transaction.error(46);
                                                      transaction.finish(2);
                                                  }}});
    InstallRun(catalogue(), &person_).install({kLaserJet});
    const std::string text = "Installing printer software...";
    EXPECT_THAT(person_.progress, ElementsAre(text, text + " 30", text, text + " 90"));
}

struct LastWordsCase {
    unsigned exit, error;
    const char* words;
};
constexpr LastWordsCase kLastWords[] = {
    {2, 2, "no network|"},
    {2, 10, "no network|"},
    {2, 37, "no server|"},
    {2, 43, "no server|"},
    {2, 64, "no server|"},
    {2, 26, "busy|wait for the other"},
    {2, 46, "The printer software could not be installed.|because"},
    {3, 0, "|"},
};

TEST_F(Install, SaysWhyItFailed) {
    for (const auto& [exit, error, words] : kLastWords) {
        FakePackageKit packageKit({"laser-driver"},
                                  {{"Install", [exit = exit, error = error](FakeTransaction& transaction) {
                                        transaction.error(error);
                                        transaction.finish(exit);
                                    }}});
        InstallRun run(catalogue(), &person_);
        run.settings.noNetworkTitle = "no network";
        run.settings.noNetworkMessage = "Intentionally left blank.";
        run.settings.noServerTitle = "no server";
        run.settings.busyTitle = "busy";
        run.settings.busyMessage = "wait for the other";
        run.install({kLaserJet});
        EXPECT_EQ(person_.lastWords.back(), words) << "exit " << exit << ", error " << error;
    }
}

TEST_F(Install, TakesItsProgressAwayWhenItIsDone) {
    FakePackageKit packageKit({"laser-driver"});
    InstallRun(catalogue(), &person_).install({kLaserJet});
    EXPECT_THAT(person_.lastWords, ElementsAre("|"));
}

TEST_F(Install, SaysThatItIsDoneWhereThatIsWanted) {
    FakePackageKit packageKit({"laser-driver"});
    InstallRun run(catalogue(), &person_);
    run.confirmsCompletion = true;
    run.install({kLaserJet});
    EXPECT_THAT(person_.lastWords, ElementsAre("The printer software is installed.|"));
}

// A package manager that wants a licence agreed to, once.
FakePackageKit::Plays licenceNeeded(bool& isAgreed) {
    return {{"Resolve",
             [&](FakeTransaction& transaction) {
                 transaction.package(isAgreed ? 1 : 2, kID);
                 transaction.finish(1);
             }},
            {"Install",
             [&](FakeTransaction& transaction) {
                 if (!isAgreed)
                     transaction.licence("licence-1", "Acme", "All rights\x1B reserved.\nReally.");
                 transaction.finish(isAgreed ? 1 : 5);
             }},
            {"AcceptEula", [&](FakeTransaction& transaction) {
                 isAgreed = true;
                 transaction.finish(1);
             }}};
}

TEST_F(Install, HasLicencesAgreedTo) {
    bool isAgreed = false;
    FakePackageKit packageKit({"laser-driver"}, licenceNeeded(isAgreed));
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "completed");
    ASSERT_EQ(person_.questions.size(), 2U);
    EXPECT_EQ(person_.questions[1].title, "Acme");
    EXPECT_EQ(person_.questions[1].body, "All rights\\x1B reserved.\nReally.");
    EXPECT_EQ(person_.questions[1].yes, "Agree");
    EXPECT_TRUE(isAgreed);
}

TEST_F(Install, AgreesToNoLicenceByItself) {
    bool isAgreed = false;
    FakePackageKit packageKit({"laser-driver"}, licenceNeeded(isAgreed));
    person_.whileThinking = [this] {
        if (person_.questions.size() == 2)
            person_.answer = PromptAnswer::No;
    };
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "cancelled");
    EXPECT_FALSE(isAgreed);
}

TEST_F(Install, DoesNotAgreeForEver) {
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction& transaction) {
                                                      transaction.licence("again", "Acme", "More.");
                                                      transaction.finish(5);
                                                  }}});
    EXPECT_EQ(InstallRun(catalogue(), &person_).install({kLaserJet}), "failed 34");
    EXPECT_EQ(person_.questions.size(), 4U);
}

TEST_F(Install, GoesOnOnceAtATime) {
    FakePackageKit packageKit({"laser-driver", "ink-driver"});
    InstallRun run(catalogue(), &person_);
    run.start({kLaserJet});
    run.start({kStylus});
    EXPECT_EQ(run.end(), "completed");
    EXPECT_EQ(run.end(50ms), "nothing");
    EXPECT_FALSE(packageKit.isInstalled("ink-driver"));
    EXPECT_THAT(run.log().lines(), ElementsAre(HasSubstr("another install goes on")));
    EXPECT_EQ(run.install({kStylus}), "completed");
}

TEST_F(Install, MayBeLeftAtAnyTime) {
    FakePackageKit packageKit({"laser-driver"}, {{"Install", [](FakeTransaction&) {}}});
    for (const auto time : {0ms, 1ms, 5ms, 20ms, 60ms}) {
        InstallRun run(catalogue(), &person_);
        run.start({kLaserJet});
        std::this_thread::sleep_for(time);
        const auto start = Clock::now();
        run.destroy();
        EXPECT_LT(Clock::now() - start, 1s) << time.count();
        EXPECT_EQ(run.end(10ms), "nothing") << time.count();
    }
    EXPECT_FALSE(packageKit.was("Cancel"));
}

}  // namespace
}  // namespace ventras
