#include "platform/linux/options/PostScriptReply.h"

#include <gmock/gmock.h>

#include <random>
#include <string>

namespace ventras {
namespace {

using namespace std::string_literals;
using namespace std::string_view_literals;
using testing::ElementsAre;
using testing::IsEmpty;

TEST(PostScriptReplyLines, EndAsOnAnySystem) {
    EXPECT_THAT(PostScriptReply::printedLines("one\r\ntwo\nthree\rfour"),
                ElementsAre("one", "two", "three", "four"));
}

TEST(PostScriptReplyLines, LeaveOutStatusMessagesBlanksAndJobEnds) {
    EXPECT_THAT(PostScriptReply::printedLines("%%[ status: idle ]%%\r\n\r\n \t True \r\n\x04\x04"
                                              "%%[ Error: undefined; OffendingCommand: foo ]%%\nFalse\n"),
                ElementsAre("True", "False"));
}

TEST(PostScriptReplyLines, AreNoneInNothing) {
    EXPECT_THAT(PostScriptReply::printedLines(""), IsEmpty());
    EXPECT_THAT(PostScriptReply::printedLines("\n\r\n \x04"), IsEmpty());
}

TEST(PostScriptReplyLines, KeepWhateverBytesCame) {
    EXPECT_THAT(PostScriptReply::printedLines("a\0b\n\xff\xfe"s), ElementsAre("a\0b"s, "\xff\xfe"));
}

struct StringCase {
    std::string line;
    std::optional<std::string> expected;
};
const StringCase kStrings[] = {
    {"(Example Laser 9000)", "Example Laser 9000"},
    {"()", ""},
    {R"((A \(B\)))", "A (B)"},
    {R"((A (B)))", "A (B)"},
    {R"((back\\slash))", "back\\slash"},
    {R"((\101\102\1013))", "ABA3"},
    {R"((caf\303\251))", "caf\xc3\xa9"},
    {R"((caf\351))", std::nullopt},  // Latin 1
    {R"((a\012b))", std::nullopt},   // a line end
    {R"((a\nb))", std::nullopt},     // the same
    {R"((a\tb))", std::nullopt},     // a tab
    {R"((a\0b))", std::nullopt},     // NUL
    {R"((open\))", std::nullopt},    // the end is none
    {"(", std::nullopt},
    {")", std::nullopt},
    {"", std::nullopt},
    {"Example", std::nullopt},
    {"/Raw", std::nullopt},
    {"(a) b", std::nullopt},
};

TEST(PostScriptStrings, AreReadAsTheyAreWritten) {
    for (const auto& [line, expected] : kStrings)
        EXPECT_EQ(PostScriptReply::stringValue(line), expected) << line;
}

TEST(PostScriptReplies, OfAnyBytesAreRead) {
    std::mt19937 random(7);
    constexpr auto kAlphabet = "()\\0127\r\n\x04 %[]A\xc3\xa9\0"sv;
    for (int round = 0; round < 20000; ++round) {
        std::string reply(random() % 24, ' ');
        for (char& c : reply)
            c = kAlphabet[random() % kAlphabet.size()];
        for (const auto& line : PostScriptReply::printedLines(reply)) {
            EXPECT_FALSE(line.empty());
            const auto value = PostScriptReply::stringValue(line);
            EXPECT_TRUE(!value || value->size() + 2 <= line.size()) << line;
        }
    }
}

}  // namespace
}  // namespace ventras
