// What is one thread's at a time: who has it, and how it comes to the next.
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/VideoDecoder.h"
#include "support/Paths.h"

#include <gtest/gtest.h>

#include <future>
#include <memory>

namespace {

std::shared_ptr<ffmpeg::Movie> openMovie()
{
    return ffmpeg::Movie::open(ffmpeg::OpenFile::open(tests::movie("clock.mp4")).value(), nullptr).value();
}

/// What `work` gives on a thread of its own.
auto elsewhere(const auto& work)
{
    return std::async(std::launch::async, work).get();
}

TEST(AReader, OfAMovieIsWhoseWhoAsksForItWhereverThatWasOpened)
{
    const auto movie = elsewhere([] { return openMovie(); });
    const auto spare = movie->demuxer(nullptr).value();
    EXPECT_EQ(spare->read(*ffmpeg::newPacket()), 0);
    const auto another = movie->demuxer(nullptr).value();
    EXPECT_EQ(another->read(*ffmpeg::newPacket()), 0);
}

#ifndef NDEBUG

TEST(AReader, IsOneThreadsUntilThatHandsItOver)
{
    const auto reader = ffmpeg::Demuxer::open(openMovie()->file(), nullptr).value();
    const auto read = [&] { return reader->read(*ffmpeg::newPacket()); };
    EXPECT_DEATH(elsewhere(read), "read was called on thread .*, but belongs to thread");
    EXPECT_EQ(read(), 0);
    reader->detach();
    EXPECT_EQ(elsewhere(read), 0);
    EXPECT_DEATH(read(), "read was called on thread");
    EXPECT_DEATH(reader->streamCount(), "streamCount was called on thread");
}

TEST(ADecoder, IsOneThreadsUntilThatHandsItOver)
{
    const auto movie = openMovie();
    const auto reader = movie->demuxer(nullptr).value();
    const int stream = movie->video()->stream;
    const auto decoder = ffmpeg::VideoDecoder::open(reader->stream(stream), *movie->video(), 1).value();
    const auto receive = [&] { return decoder->receive(); };
    EXPECT_DEATH(elsewhere(receive), "receive was called on thread");
    EXPECT_FALSE(receive()) << "it was sent nothing";
    decoder->detach();
    EXPECT_FALSE(elsewhere(receive));
    EXPECT_DEATH(receive(), "receive was called on thread");
}

#endif

} // namespace
