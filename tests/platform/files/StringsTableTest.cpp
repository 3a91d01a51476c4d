#include "platform/files/StringsTable.h"

#include <gmock/gmock.h>

#include <cerrno>

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Pair;

platform::StringsTable tableOf(std::string_view text)
{
    const auto parsed = platform::parseStrings(text, "de.strings");
    EXPECT_EQ(parsed.error, nullptr) << parsed.error->description();
    return parsed.table;
}

/// Of a table that is not whole: why not.
std::string troubleOf(std::string_view text, platform::StringsTable* table = nullptr)
{
    const auto parsed = platform::parseStrings(text, "de.strings");
    if (table)
        *table = parsed.table;
    return parsed.error ? parsed.error->description() : "";
}

TEST(AStringsTable, HasATextForEachKey)
{
    EXPECT_THAT(tableOf("\"SAVE\" = \"Sichern\";\n\"CLOSE\"=\"Schließen\" ; "),
                ElementsAre(Pair("CLOSE", "Schließen"), Pair("SAVE", "Sichern")));
    EXPECT_THAT(tableOf(""), IsEmpty());
    EXPECT_THAT(tableOf(" \t\r\n\v\f"), IsEmpty());
    EXPECT_THAT(tableOf("\"a\" = \"\";"), ElementsAre(Pair("a", "")));
}

TEST(AStringsTable, HasComments)
{
    EXPECT_THAT(tableOf("/* \"no\" = \"no\"; */ \"a\" /**/ = // \"b\n \"c\" ; // the end"),
                ElementsAre(Pair("a", "c")));
    EXPECT_THAT(tableOf("\"a\" = \"/* // */\";"), ElementsAre(Pair("a", "/* // */"))) << "not within quotes";
    EXPECT_THAT(tableOf("/* a\n * b **/\"a\"=\"b\";"), ElementsAre(Pair("a", "b")));
}

TEST(AStringsTable, EscapesWhatCannotBeWritten)
{
    EXPECT_THAT(tableOf(R"("a\"b" = "\\ \n\r\t \U201C\U00e4\U007F";)"),
                ElementsAre(Pair("a\"b", "\\ \n\r\t \u201C\u00E4\x7F")));
    EXPECT_THAT(tableOf(R"("a" = "\U0041\U07FF\U0800\UFFFD\UD7FF\UE000";)"),
                ElementsAre(Pair("a", "A\u07FF\u0800\uFFFD\uD7FF\uE000")));
}

TEST(AStringsTable, NeedsNoQuotesForPlainWords)
{
    EXPECT_THAT(tableOf("azAZ09_.- = de-DE;"), ElementsAre(Pair("azAZ09_.-", "de-DE")));
}

TEST(AStringsTable, MayBeginWithAByteOrderMark)
{
    EXPECT_THAT(tableOf("\xEF\xBB\xBF\"a\" = \"b\";"), ElementsAre(Pair("a", "b")));
}

TEST(AStringsTable, HasTheLaterOfTwoTextsOfAKey)
{
    EXPECT_THAT(tableOf("\"a\" = \"b\"; \"a\" = \"c\";"), ElementsAre(Pair("a", "c")));
}

TEST(AStringsTable, KeepsWhatStandsBeforeAnErrorAndSaysWhereItIs)
{
    platform::StringsTable table;
    EXPECT_EQ(troubleOf("\"a\" = \"b\";\n\n\"c\" \"d\";\n\"e\" = \"f\";", &table),
              "de.strings, line 3: there is no = behind the key");
    EXPECT_THAT(table, ElementsAre(Pair("a", "b")));
    EXPECT_EQ(platform::parseStrings("?", "x").error->code(), EINVAL);
}

TEST(AStringsTable, SaysWhatIsWrongWithIt)
{
    EXPECT_THAT(troubleOf("\"a\" = \"b\""), HasSubstr("there is no ; behind the text"));
    EXPECT_THAT(troubleOf("\"a\" = \"b\" \"c\" = \"d\";"), HasSubstr("there is no ;"));
    EXPECT_THAT(troubleOf("\"a\""), HasSubstr("there is no = behind the key"));
    EXPECT_THAT(troubleOf("\"a\" ="), HasSubstr("it ends too early"));
    EXPECT_THAT(troubleOf("\"a\" = ;"), HasSubstr("there is no word here"));
    EXPECT_THAT(troubleOf("= \"a\";"), HasSubstr("there is no word here"));
    EXPECT_EQ(troubleOf("\n\"a\" = \"b;\n\n"), "de.strings, line 2: these quotes have no end");
    EXPECT_THAT(troubleOf("\"a\" = \"b\\"), HasSubstr("nothing is written with this backslash"));
    EXPECT_THAT(troubleOf("\"a\" = \"\\x\";"), HasSubstr("nothing is written with this backslash"));
    for (const char* number : {"\\U", "\\U12", "\\U123\"", "\\U12G4", "\\U12:4", "\\U12/4", "\\U12@4", "\\U12`4"})
        EXPECT_THAT(troubleOf(std::string("\"a\" = \"") + number + "\";"), HasSubstr("four hexadecimal digits"))
            << number;
    EXPECT_THAT(troubleOf("\"a\" = \"\\UD800\";"), HasSubstr("half a character"));
    EXPECT_THAT(troubleOf("\"a\" = \"\\UDFFF\";"), HasSubstr("half a character"));
    for (const char* comment : {"/* a", "/*/", "\"a\" /* = \"b\";", "\"a\" = /* \"b\";", "\"a\" = \"b\" /* ;"})
        EXPECT_THAT(troubleOf(comment), HasSubstr("this comment has no end")) << comment;
}

TEST(AStringsTable, IsUtf8AndNothingElse)
{
    platform::StringsTable table;
    EXPECT_EQ(troubleOf("\"a\" = \"b\";\n\"c\" = \"\xE4\";", &table), "de.strings, line 2: this is not UTF-8");
    EXPECT_THAT(table, ElementsAre(Pair("a", "b")));
    EXPECT_EQ(platform::parseStrings("\xFF", "x").error->code(), EILSEQ);
    EXPECT_THAT(troubleOf(std::string_view("\xFF\xFE\"\0a\0", 6)), HasSubstr("line 1: this is not UTF-8"));
}

} // namespace
