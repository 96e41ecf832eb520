#include "platform/linux/options/PpdQueries.h"

#include <gmock/gmock.h>

#include <string>

#include "tests/parts/OpenedPpd.h"
#include "tests/usb/PostScriptPpd.h"

namespace ventras {
namespace {

using testing::ElementsAre;
using testing::Optional;
using testing::SizeIs;

std::vector<PpdQuery> queriesIn(const std::string& text) {
    const auto ppd = openedPpd(text);
    EXPECT_TRUE(ppd) << text;
    return ppd ? installableOptionQueries(ppd.get()) : std::vector<PpdQuery>{};
}

TEST(PpdQueries, AreThoseOfInstallableOptions) {
    const auto queries = queriesIn(postScriptPpd());
    ASSERT_THAT(queries, SizeIs(2));
    EXPECT_EQ(queries[0].option, "Duplexer");
    EXPECT_EQ(queries[0].program, "duplexerInstalled {(True)} {(False)} ifelse = flush");
    EXPECT_THAT(queries[0].choices, ElementsAre("True", "False"));
    EXPECT_EQ(queries[1].option, "Trays");
    EXPECT_THAT(queries[1].choices, ElementsAre("None", "One", "Two"));
}

TEST(PpdQueries, AreNoneWithoutInstallableOptions) {
    auto text = postScriptPpd();
    for (auto at = text.find("InstallableOptions"); at != std::string::npos;
         at = text.find("InstallableOptions"))
        text.replace(at, 18, "Finishing");
    EXPECT_THAT(queriesIn(text), SizeIs(0));
}

const PpdQuery kQuery{"Trays", "", {"None", "One", "Two"}};

TEST(PpdQueryAnswer, IsAChoiceOfTheOption) {
    EXPECT_THAT(chosenBy(kQuery, {"Two"}), Optional(std::string("Two")));
    EXPECT_THAT(chosenBy(kQuery, {"some noise", "One"}), Optional(std::string("One")));
    EXPECT_THAT(chosenBy(kQuery, {"One", "Two"}), Optional(std::string("Two")));
}

TEST(PpdQueryAnswer, IsNothingElse) {
    EXPECT_EQ(chosenBy(kQuery, {}), std::nullopt);
    EXPECT_EQ(chosenBy(kQuery, {"Unknown", "two", "Three", "One Two"}), std::nullopt);
}

struct DefaultsCase {
    std::string text;
    std::map<std::string, std::string> choices;
    std::string expected;
};
const DefaultsCase kDefaults[] = {
    {"*DefaultTrays: None\n*DefaultTraysX: None\n",
     {{"Trays", "Two"}},
     "*DefaultTrays: Two\n*DefaultTraysX: None\n"},
    {"a\r\n*DefaultTrays: None/No trays\r\nb", {{"Trays", "One"}}, "a\r\n*DefaultTrays: One\r\nb"},
    {"*DefaultTrays:None\n*DefaultTrays: One",
     {{"Trays", "Two"}},
     "*DefaultTrays: Two\n*DefaultTrays: Two\n"},
    {"*Trays One: \"\"", {{"Trays", "One"}}, "*Trays One: \"\"\n*DefaultTrays: One\n"},
    {" *DefaultTrays: None\n", {{"Trays", "One"}}, " *DefaultTrays: None\n*DefaultTrays: One\n"},
    {"*DefaultTrays: None\n", {}, "*DefaultTrays: None\n"},
    {"*DefaultTrays: None", {}, "*DefaultTrays: None"},
    {"", {}, ""},
};

TEST(PpdDefaults, AreReplacedLineByLine) {
    for (const auto& [text, choices, expected] : kDefaults)
        EXPECT_EQ(withDefaults(text, choices), expected) << text;
}

}  // namespace
}  // namespace ventras
