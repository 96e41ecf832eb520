#include "platform/TagPredicate.h"

#include <gtest/gtest.h>

#include <random>
#include <set>
#include <vector>

namespace ventras {
namespace {

using Tags = std::set<std::string>;

bool holds(const TagPredicate& predicate, const Tags& tags) {
    return predicate.holds([&](const std::string& tag) { return tags.contains(tag); });
}

// "malformed", or whether the condition holds for the tags.
std::string verdict(std::string_view text, const Tags& tags) {
    const auto predicate = TagPredicate::parse(text);
    if (!predicate)
        return "malformed";
    return holds(*predicate, tags) ? "holds" : "fails";
}

struct Case {
    std::string_view text;
    Tags tags;
    std::string_view verdict;
};

void expectVerdicts(const std::vector<Case>& cases) {
    for (const auto& [text, tags, expected] : cases)
        EXPECT_EQ(verdict(text, tags), expected) << text << " for " << testing::PrintToString(tags);
}

TEST(TagPredicate, HoldsWhenTheTagIsThere) {
    expectVerdicts({{"\"a\" IN tags", {"a"}, "holds"},
                    {"\"a\" IN tags", {"b"}, "fails"},
                    {"\"a\" IN tags", {}, "fails"},
                    {"\"a\" IN tags", {"A"}, "fails"},
                    {"\"\" IN tags", {""}, "holds"},
                    {"\"a b;c:(d) OR\" IN tags", {"a b;c:(d) OR"}, "holds"},
                    {"\"HP \xff\" IN tags", {"HP \xff"}, "holds"}});
}

TEST(TagPredicate, ReadsItsWordsInAnyCaseAndAnyBlanks) {
    expectVerdicts({{"\"a\" in tags", {"a"}, "holds"},
                    {"\"a\" In TAGS ", {"a"}, "holds"},
                    {"  (\t\"a\"\r\nIN\n tags )  ", {"a"}, "holds"},
                    {"\"a\"IN tags", {"a"}, "holds"},
                    {"(\"a\" in tags)and(\"b\" in tags)", {"a", "b"}, "holds"},
                    {"(\"a\" in tags)oR(\"b\" in tags)", {"b"}, "holds"}});
}

TEST(TagPredicate, JoinsConditions) {
    const std::string_view both = "(\"a\" in tags) AND (\"b\" in tags)";
    const std::string_view either = "(\"a\" in tags) OR (\"b\" in tags)";
    expectVerdicts({{both, {"a", "b"}, "holds"},
                    {both, {"a"}, "fails"},
                    {both, {"b"}, "fails"},
                    {either, {"a"}, "holds"},
                    {either, {"b"}, "holds"},
                    {either, {"c"}, "fails"}});
}

TEST(TagPredicate, BindsAndCloserThanOr) {
    const std::string_view kindOrPart = "\"a\" in tags OR \"b\" in tags AND \"c\" in tags";
    const std::string_view partOrKind = "\"b\" in tags AND \"c\" in tags OR \"a\" in tags";
    const std::string_view grouped = "(\"a\" in tags OR \"b\" in tags) AND \"c\" in tags";
    expectVerdicts({{kindOrPart, {"a"}, "holds"},
                    {kindOrPart, {"b"}, "fails"},
                    {kindOrPart, {"b", "c"}, "holds"},
                    {partOrKind, {"a"}, "holds"},
                    {partOrKind, {"c"}, "fails"},
                    {grouped, {"a"}, "fails"},
                    {grouped, {"a", "c"}, "holds"},
                    {grouped, {"c"}, "fails"}});
}

TEST(TagPredicate, IsNothingWhenTheTextIsNotExactlyOneCondition) {
    for (const std::string_view text : {"",
                                        " ",
                                        "a",
                                        "\"a\"",
                                        "\"a\" IN",
                                        "\"a\" IN tag",
                                        "\"a\" IN tagsx",
                                        "a IN tags",
                                        "\"a IN tags",
                                        "'a' IN tags",
                                        "()",
                                        "(\"a\" IN tags",
                                        "\"a\" IN tags)",
                                        "\"a\" IN tags \"b\" IN tags",
                                        "\"a\" IN tags AND",
                                        "OR \"a\" IN tags",
                                        "\"a\" IN tags XOR \"b\" IN tags",
                                        "NOT \"a\" IN tags",
                                        "TRUE",
                                        "tags",
                                        "\"a\" IN tags; \"b\" IN tags",
                                        "\"a\"b\" IN tags",
                                        "\"a\\\"b\" IN tags",
                                        "\"a\" IN tags ANDx \"b\" IN tags"})
        EXPECT_FALSE(TagPredicate::parse(text)) << text;
}

std::string nested(int depth) {
    return std::string(static_cast<std::size_t>(depth), '(') + "\"a\" IN tags" +
           std::string(static_cast<std::size_t>(depth), ')');
}

TEST(TagPredicate, BoundsHowDeepItNests) {
    EXPECT_EQ(verdict(nested(30), {"a"}), "holds");
    EXPECT_EQ(verdict(nested(1000), {"a"}), "malformed");
    EXPECT_EQ(verdict(nested(1'000'000), {"a"}), "malformed");
}

TEST(TagPredicate, ReadsThousandsOfTerms) {
    std::string text = "\"0\" IN tags";
    for (int i = 1; i < 5000; ++i)
        text += " OR \"" + std::to_string(i) + "\" IN tags";
    EXPECT_EQ(verdict(text, {"4999"}), "holds");
    EXPECT_EQ(verdict(text, {"5000"}), "fails");
}

// A condition built at random, as text and as what it is worth for the tags.
struct Made {
    std::string text;
    bool value;
};

Made makeCondition(std::mt19937& random, const Tags& tags, int depth) {
    if (depth == 0 || random() % 4 == 0) {
        const std::string tag(1, static_cast<char>('a' + random() % 6));
        return {"\"" + tag + "\" IN tags", tags.contains(tag)};
    }
    const auto left = makeCondition(random, tags, depth - 1);
    const auto right = makeCondition(random, tags, depth - 1);
    const bool isAnd = random() % 2 == 0;
    return {"(" + left.text + (isAnd ? ") AND (" : ") OR (") + right.text + ")",
            isAnd ? left.value && right.value : left.value || right.value};
}

TEST(TagPredicate, IsWorthWhatItsPartsAreWorth) {
    std::mt19937 random(5);
    for (int round = 0; round < 500; ++round) {
        const Tags tags{std::string(1, static_cast<char>('a' + random() % 6)), "c"};
        const auto [text, value] = makeCondition(random, tags, 5);
        EXPECT_EQ(verdict(text, tags), value ? "holds" : "fails") << text;
    }
}

}  // namespace
}  // namespace ventras
