#include "base/Error.h"
#include "base/Log.h"
#include "base/Once.h"
#include "base/Result.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

using testing::ElementsAre;
using testing::HasSubstr;

TEST(ErrorTests, AnErrorSaysWhatItWasToldOrElseItsDomainAndCode)
{
    EXPECT_EQ(base::Error::make("movies", 7, "No picture")->description(), "No picture");
    EXPECT_EQ(base::Error("movies", 7).description(), "movies error 7");
}

TEST(ErrorTests, LogLinesCarryTheLowHalfOfTheCode)
{
    EXPECT_EQ(base::Error("movies", -1).code32(), -1);
    EXPECT_EQ(base::Error("movies", 0x1'0000'0002).code32(), 2);
}

TEST(ErrorTests, AnErrorOfTheSystemSaysWhatWasBeingDone)
{
    const auto error = base::Error::fromErrno(ENOENT, "open /a");
    EXPECT_EQ(error->domain(), base::kPosixErrorDomain);
    EXPECT_EQ(error->code(), ENOENT);
    EXPECT_EQ(error->description(), "open /a: there is no such file or directory") << "in plain words";
}

TEST(ResultTests, AResultIsAValueOrAnError)
{
    const base::Result<int> good(3);
    EXPECT_TRUE(good);
    EXPECT_EQ(good.value(), 3);
    EXPECT_EQ(good.error(), nullptr);
    const base::Result<int> bad(base::Error::make("movies", 7, "No"));
    EXPECT_FALSE(bad);
    EXPECT_EQ(bad.valueOr(5), 5);
    EXPECT_EQ(bad.error()->code(), 7);
    EXPECT_TRUE(base::Result<void>());
}

TEST(OnceTests, OnlyTheFirstCallerMakesTheValue)
{
    base::Once<int> once;
    EXPECT_EQ(once.get([] { return 1; }), 1);
    EXPECT_EQ(once.get([] { return 2; }), 1);
}

std::string written(base::StreamLog::Style style, bool verbose)
{
    char* text = nullptr;
    std::size_t size = 0;
    std::FILE* const stream = open_memstream(&text, &size);
    base::StreamLog log(stream, style, verbose);
    log.message("happened");
    log.error("failed");
    log.console("detail of \x1b[31m");
    std::fclose(stream);
    std::string result(text, size);
    std::free(text);
    return result;
}

TEST(LogTests, AQuietLogTellsErrorsAndDetailsOnly)
{
    EXPECT_EQ(written(base::StreamLog::Style::Plain, false), "error: clipsa: failed\nclipsa: detail of ?[31m\n");
}

TEST(LogTests, AVerboseLogTellsWhatHappensToo)
{
    EXPECT_THAT(written(base::StreamLog::Style::Plain, true), HasSubstr("clipsa: happened\n"));
}

TEST(LogTests, TheJournalGetsLevels)
{
    EXPECT_EQ(written(base::StreamLog::Style::Journal, false),
              "<6>clipsa: happened\n<3>clipsa: failed\n<5>clipsa: detail of ?[31m\n");
}

TEST(LogTests, TheMemoryKeepsLinesInOrderAndByKind)
{
    using Kind = base::MemoryLog::Line::Kind;
    base::MemoryLog log;
    log.message("a");
    log.error("b");
    log.message("c");
    EXPECT_THAT(log.texts(Kind::Message), ElementsAre("a", "c"));
    EXPECT_TRUE(log.contains(Kind::Error, "b"));
    EXPECT_FALSE(log.contains(Kind::Error, "a"));
    EXPECT_EQ(log.lines().size(), 3U);
}

} // namespace
