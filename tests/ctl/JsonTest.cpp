#include "ctl/Json.h"

#include <gtest/gtest.h>

namespace ventras {
namespace {

TEST(Json, IsWrittenOnOneLineInTheOrderOfItsMembers) {
    const Object object{
        {"z", Value{}}, {"a", true}, {"m", -5}, {"t", "\"\\\n\x7F"}, {"l", Array{1, "x", Array{}}},
        {"o", Object{}}};
    EXPECT_EQ(toJson(object), R"({"z":null,"a":true,"m":-5,"t":"\"\\\n\u007f","l":[1,"x",[]],"o":{}})");
}

TEST(Json, HasNothingThatATerminalObeys) {
    EXPECT_EQ(toJson(std::string("\x1B[0m\x7F\xC2\x80\xC2\x9B\xC2\xA0é€")),
              "\"\\u001b[0m\\u007f\\u0080\\u009b\xC2\xA0é€\"");
}

TEST(Json, ReadsWhatItWrote) {
    for (const std::string text : {"null", "true", "-9223372036854775808", "9223372036854775807", "1.5",
                                   R"("\u0000é")", R"([[],{}])", R"({"b":1,"a":[null,{"c":"x"}]})"}) {
        const auto value = parseJson(text);
        ASSERT_TRUE(value) << text;
        EXPECT_EQ(toJson(*value), text);
    }
}

TEST(Json, KeepsTheSizeOfNumbersThatAreTooLargeForAnInteger) {
    const auto value = parseJson("18446744073709551615");
    ASSERT_TRUE(value && std::holds_alternative<double>(*value));
    EXPECT_DOUBLE_EQ(std::get<double>(*value), 18446744073709551615.0);
}

TEST(Json, RefusesWhatIsNone) {
    for (const std::string text : {"", " ", "nul", "[1,]", "{\"a\"}", "1 2", "'a'", "\"\xFF\"", "[1", "NaN"})
        EXPECT_FALSE(parseJson(text)) << text;
}

TEST(Json, RefusesDeepNesting) {
    const auto nested = [](std::size_t depth) { return std::string(depth, '[') + std::string(depth, ']'); };
    EXPECT_TRUE(parseJson(nested(20)));
    EXPECT_FALSE(parseJson(nested(50)));
}

}  // namespace
}  // namespace ventras
