// Objects that programs read, put together byte for byte.
#include "app/host/JsonObject.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

namespace {

std::string textOf(std::string_view text)
{
    return host::JsonObject().add("t", text).text();
}

std::string numberOf(double number)
{
    return host::JsonObject().add("n", number).text();
}

TEST(AJsonObject, HasItsMembersInOrder)
{
    EXPECT_EQ(host::JsonObject().text(), "{}");
    host::JsonObject object;
    object.add("a", "x").addUnlessEmpty("b", "").addUnlessEmpty("c", "y").addFlag("d", false).addFlag("e", true);
    object.add("f", std::int64_t{1} << 40).addTexts("g", {}).addTexts("h", {"1", "\""}).addList("i", {"{}", "{}"});
    EXPECT_EQ(object.text(), R"({"a":"x","c":"y","d":false,"e":true,"f":1099511627776,"g":[],"h":["1","\""],)"
                             R"("i":[{},{}]})");
}

TEST(AJsonObject, QuotesNoMoreThanItMust)
{
    EXPECT_EQ(textOf("\"\\/"), R"({"t":"\"\\/"})");
    EXPECT_EQ(textOf("\x1F\x20\x7E\x7F"), "{\"t\":\"\\u001f\x20\x7E\\u007f\"}");
    // What terminals obey is not printed, in one byte or in two.
    EXPECT_EQ(textOf("\u0080\u009B\u009F\u00A0é"), "{\"t\":\"\\u0080\\u009b\\u009f\u00A0é\"}");
    EXPECT_EQ(textOf("𝄞€Ā\u0100"), "{\"t\":\"𝄞€Ā\u0100\"}");
    EXPECT_EQ(textOf(std::string_view("a\0b", 3)), R"({"t":"a\u0000b"})");
}

TEST(AJsonObject, HasAMarkForEachByteThatIsNoText)
{
    EXPECT_EQ(textOf("\xFF\xFEx\xC3"), "{\"t\":\"\uFFFD\uFFFDx\uFFFD\"}");
}

TEST(AJsonObject, HasNumbersToTheMillionth)
{
    EXPECT_EQ(numberOf(0.1234564), R"({"n":0.123456})");
    EXPECT_EQ(numberOf(0.1234566), R"({"n":0.123457})");
    EXPECT_EQ(numberOf(-2.5), R"({"n":-2.5})");
    EXPECT_EQ(numberOf(3600), R"({"n":3600})");
    EXPECT_EQ(numberOf(std::numeric_limits<double>::infinity()), R"({"n":null})");
    EXPECT_EQ(numberOf(std::nan("")), R"({"n":null})");
}

} // namespace
