#include "platform/files/MessageCatalog.h"

#include "support/EnglishWords.h"

#include <gtest/gtest.h>

namespace {

TEST(TheWordsForAnError, AreItsMessageInTheUsersLanguage)
{
    const tests::EnglishWords words;
    const auto error =
        base::Error::withMessage(base::Error::make("engine", 7, "for the log"), "MOVIE_GONE", {{"name", "a.mp4"}});
    EXPECT_EQ(platform::wordsFor(*error, words), "“a.mp4” cannot be opened: it is no longer there.");
    EXPECT_EQ(error->description(), "for the log");
    EXPECT_EQ(error->domain(), "engine");
    EXPECT_EQ(error->code(), 7);
}

TEST(TheWordsForAnError, AreItsDescriptionWhereThereIsNoMessage)
{
    const tests::EnglishWords words;
    const auto error = base::Error::make("engine", 7, "for the log");
    EXPECT_EQ(platform::wordsFor(*error, words), "for the log");
    EXPECT_EQ(platform::wordsFor(*base::Error::withMessage(error, "NO_SUCH_KEY", {}), words), "for the log");
}

} // namespace
