#include "drivers/SoughtWord.h"

#include <gtest/gtest.h>

#include <random>
#include <string>

#include "deviceid/TextScan.h"

namespace ventras {
namespace {

constexpr auto kNowhere = std::string_view::npos;

struct WordCase {
    std::string_view word, text;
    std::size_t expected;
};
constexpr WordCase kWords[] = {
    {"4", "LaserJet 4", 9},
    {"laserjet", "MDL:LASERJET 4", 4},
    {"LaserJet", "laserjet", 0},
    {"4/4M", "LaserJet 4/4m", 9},
    {"x4", "4x4", 1},      // its digit stands too far in front at first
    {"aab1", "aaab1", 1},  // begins twice
    {"1a1", "1a1a1", 0},   // overlaps itself
    {"[", "{", kNowhere},  // no letter: has no other case
    {"@", "`", kNowhere},  // the same
    {"deskjet", "deskje", kNowhere},
    {"deskjet", "", kNowhere},
    {"a", "\xC3\x81", kNowhere},
    {"a", std::string_view("\0A", 2), 1},
};

TEST(SoughtWord, IsFoundWhereItFirstOccursInAnyCase) {
    for (const auto& [word, text, expected] : kWords)
        EXPECT_EQ(SoughtWord(word).findIn(text), expected) << word << " in " << text;
}

TEST(SoughtWord, IsRareWithADigitAndSomeLength) {
    EXPECT_TRUE(SoughtWord("990c").isRare());
    EXPECT_FALSE(SoughtWord("series").isRare());
    EXPECT_FALSE(SoughtWord("4").isRare());
}

TEST(SoughtWord, IsFoundLikeAnyText) {
    constexpr std::string_view kLetters = "aAbB1[@\x80 ";
    std::mt19937 random(7);
    const auto text = [&](std::size_t shortest, std::size_t longest) {
        std::string made(shortest + random() % (longest - shortest + 1), ' ');
        for (auto& c : made)
            c = kLetters[random() % kLetters.size()];
        return made;
    };
    for (int i = 0; i < 20'000; ++i) {
        const auto word = text(1, 4);
        const auto in = text(0, 12);
        EXPECT_EQ(SoughtWord(word).findIn(in), TextScan::findIgnoringCase(in, word)) << word << " in " << in;
    }
}

}  // namespace
}  // namespace ventras
