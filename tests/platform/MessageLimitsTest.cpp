#include "platform/MessageLimits.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/parts/ScriptedReply.h"

namespace ventras {
namespace {

using namespace std::string_literals;

const std::string kHeader = "\2\0\0\0\0\0\0\1\4"s;
const std::string kBegin = "\x34\0\0\0\0"s;
const std::string kEnd = "\x37\0\0\0\0"s;
const std::string kMember = "\x4a\0\0\0\1m"s;
const std::string kEndOfMessage = "\3"s;

std::string repeated(const std::string& text, int count) {
    std::string all;
    for (int i = 0; i < count; ++i)
        all += text;
    return all;
}

std::string nested(int depth) {
    return kBegin + repeated(kMember + kBegin, depth - 1) + repeated(kEnd, depth);
}

bool passes(const std::string& bytes, std::size_t atOnce = std::string::npos) {
    MessageLimits limits;
    for (std::size_t at = 0; at < bytes.size(); at += std::min(atOnce, bytes.size())) {
        const auto part = bytes.substr(at, atOnce);
        if (!limits.follow({reinterpret_cast<const std::uint8_t*>(part.data()), part.size()}))
            return false;
    }
    return true;
}

TEST(Nesting, IsNoneInAMessageWithoutCollections) {
    EXPECT_TRUE(passes(kHeader + rawAttribute(IPP_TAG_NAME, "printer-name", "4444") + kEndOfMessage));
}

TEST(Nesting, MayBeSixteenDeep) {
    EXPECT_TRUE(passes(kHeader + nested(16) + kEndOfMessage));
    EXPECT_FALSE(passes(kHeader + nested(17) + kEndOfMessage));
    EXPECT_FALSE(passes(kHeader + nested(100'000) + kEndOfMessage));
}

TEST(Nesting, IsSeenHoweverTheBytesArrive) {
    for (const std::size_t atOnce : {1U, 2U, 3U, 7U, 64U}) {
        EXPECT_TRUE(passes(kHeader + nested(16) + kEndOfMessage, atOnce)) << atOnce;
        EXPECT_FALSE(passes(kHeader + nested(17) + kEndOfMessage, atOnce)) << atOnce;
    }
}

TEST(Nesting, DoesNotGrowWithCollectionsSideBySide) {
    EXPECT_TRUE(passes(kHeader + repeated(nested(2), 1000) + kEndOfMessage));
}

TEST(Nesting, IsNotToldByBytesInNamesAndValues) {
    const auto names = rawAttribute(IPP_TAG_NAME, "4", "4") + rawAttribute(IPP_TAG_NAME, "7", "7");
    EXPECT_TRUE(passes(kHeader + repeated(names, 100) + kEndOfMessage));
    EXPECT_FALSE(
        passes(kHeader + repeated(kBegin + rawAttribute(IPP_TAG_NAME, "7", "7"), 17) + kEndOfMessage));
}

TEST(Nesting, EndsWithTheMessage) {
    EXPECT_TRUE(passes(kHeader + kEndOfMessage + repeated(kBegin, 100)));
}

TEST(Nesting, DoesNotEndBeforeItBegins) {
    EXPECT_FALSE(passes(kHeader + kEnd + kEndOfMessage));
}

// RFC 8010 and libcups read the bytes behind it differently.
TEST(MessageLimits, AllowNoExtensionTag) {
    EXPECT_FALSE(passes(kHeader + rawAttribute(IPP_TAG_EXTENSION, "x", "\0\0\0\x34"s) + kEndOfMessage));
}

TEST(MessageLimits, AllowAQuarterOfAMillionValues) {
    const auto value = rawAttribute(IPP_TAG_NAME, "", "n");
    EXPECT_TRUE(passes(kHeader + repeated(value, 250'000) + kEndOfMessage));
    EXPECT_FALSE(passes(kHeader + repeated(value, 250'001) + kEndOfMessage));
}

// libcups makes an attribute of each that follows one of its kind.
TEST(MessageLimits, AllowAHundredThousandGroups) {
    EXPECT_TRUE(passes(kHeader + repeated("\4"s, 99'999) + kEndOfMessage));  // one is in the header
    EXPECT_FALSE(passes(kHeader + repeated("\4"s, 100'000) + kEndOfMessage));
    EXPECT_FALSE(passes(kHeader + repeated("\2\4"s, 50'000) + kEndOfMessage));
}

TEST(MessageLimits, CountTheMembersOfCollections) {
    EXPECT_FALSE(passes(kHeader + repeated(nested(2), 50'001) + kEndOfMessage));
}

}  // namespace
}  // namespace ventras
