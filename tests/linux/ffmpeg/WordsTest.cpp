#include "linux/ffmpeg/Libraries.h"

#include <gtest/gtest.h>

namespace {

TEST(Words, AreNoneOfTheLibrary)
{
    using ffmpeg::textOf;
    EXPECT_EQ(textOf(AVERROR_INVALIDDATA), "it is damaged, or of a kind that is not known here");
    EXPECT_EQ(textOf(AVERROR_PATCHWELCOME), "this variety of it is not known here");
    EXPECT_EQ(textOf(AVERROR(ENOSYS)), "this variety of it is not known here");
    EXPECT_EQ(textOf(AVERROR_DECODER_NOT_FOUND), "there is no decoder for it here");
    EXPECT_EQ(textOf(AVERROR_EOF), "it ends too early");
    EXPECT_EQ(textOf(AVERROR(EINVAL)), "it contradicts itself");
    EXPECT_EQ(textOf(AVERROR(EACCES)), "that is not allowed");
    EXPECT_EQ(textOf(AVERROR(EIO)), "the disk or the network has an error");
    EXPECT_EQ(textOf(AVERROR_PROTOCOL_NOT_FOUND).find("something unexpected happened ("), 0U);
}

TEST(Words, SayLengthsAsPeopleDo)
{
    using ffmpeg::lengthInWords;
    EXPECT_EQ(lengthInWords(0.041), "0.04 s");
    EXPECT_EQ(lengthInWords(2.04), "2.0 s");
    EXPECT_EQ(lengthInWords(59.94), "59.9 s");
    EXPECT_EQ(lengthInWords(59.96), "1:00");
    EXPECT_EQ(lengthInWords(22 * 60 + 12.9), "22:12");
    EXPECT_EQ(lengthInWords(3600 + 61), "1:01:01");
}

} // namespace
