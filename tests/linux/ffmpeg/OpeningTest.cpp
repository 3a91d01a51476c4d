#include "support/EngineTest.h"
#include "support/PrivateDirectory.h"

#include <cstdio>
#include <filesystem>
#include <fstream>

namespace {

using platform::MediaType;

struct KeyLog final : runtime::KeyValueObserver {
    void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, runtime::Object&,
                                                        const runtime::KeyValueChange&, void*) override
    {
        keys.emplace_back(keyPath);
    }
    std::vector<std::string> keys;
};

class Opening : public tests::EngineTest {
protected:
    double durationOf(const std::string& name)
    {
        EXPECT_EQ(open(movie(name)), Status::ReadyToPlay) << name;
        return item->duration().seconds();
    }
    void expectFailure(const std::string& path)
    {
        EXPECT_EQ(open(path), Status::Failed) << path;
        ASSERT_TRUE(item->error());
        const std::string words = item->error()->description();
        EXPECT_NE(words.find(path.substr(path.rfind('/') + 1)), std::string::npos) << words;
        EXPECT_TRUE(log.contains(base::MemoryLog::Line::Kind::Error, words));
        EXPECT_FALSE(item->duration().isNumeric());
        EXPECT_EQ(player->currentFrame(), nullptr);
    }
};

TEST_F(Opening, AnItemIsUnknownUntilTheMainQueueTellsDurationAndStatus)
{
    item = media.playerItemWithAsset(media.assetWithURL(base::Url::fromPath(movie("clock.mp4"))));
    KeyLog keys;
    item->addObserver(keys, platform::PlayerItem::kDurationKey);
    item->addObserver(keys, platform::PlayerItem::kStatusKey);
    EXPECT_EQ(item->status(), Status::Unknown);
    EXPECT_FALSE(item->duration().isNumeric());
    EXPECT_TRUE(item->asset()->tracks().empty());
    ASSERT_TRUE(waitFor([&] { return item->status() == Status::ReadyToPlay; }));
    EXPECT_EQ(keys.keys, (std::vector<std::string>{"duration", "status"}));
    EXPECT_EQ(item->error(), nullptr);
}

TEST_F(Opening, AnItemOfALoadedAssetIsToldLaterToo)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    const auto second = media.playerItemWithAsset(asset);
    EXPECT_EQ(second->status(), Status::Unknown);
    mainQueue.drain();
    EXPECT_EQ(second->status(), Status::ReadyToPlay);
}

TEST_F(Opening, TracksTellSizesTurnsAndTimes)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    const auto tracks = asset->tracks();
    ASSERT_EQ(tracks.size(), 3u);
    EXPECT_EQ(tracks[0].type, MediaType::Video);
    EXPECT_EQ(tracks[0].naturalSize, (base::Size{640, 360}));
    EXPECT_EQ(tracks[0].preferredTransform, base::AffineTransform{});
    EXPECT_EQ(tracks[0].timeRange.start, at(0));
    EXPECT_EQ(tracks[0].timeRange.duration, at(4));
    EXPECT_EQ(tracks[1].type, MediaType::Audio);
    EXPECT_EQ(tracks[2].type, MediaType::Audio);
    EXPECT_EQ(item->duration(), at(4));
    EXPECT_EQ(item->duration().timescale, 15360);
}

TEST_F(Opening, ATurnedMovieKeepsItsNaturalSizeAndTellsHowToTurnIt)
{
    for (const auto* name : {"rotated.mp4", "rotated-clockwise.mp4"}) {
        ASSERT_EQ(open(movie(name)), Status::ReadyToPlay);
        const auto track = asset->tracks()[0];
        EXPECT_EQ(track.naturalSize, (base::Size{640, 360}));
        const auto& t = track.preferredTransform;
        EXPECT_EQ(std::abs(t.a * 640 + t.c * 360), 360);
        EXPECT_EQ(std::abs(t.b * 640 + t.d * 360), 640);
        EXPECT_EQ(player->currentFrame()->displaySize(), (base::Size{360, 640}));
        for (const base::Point corner : {base::Point{0, 0}, base::Point{640, 360}}) {
            const base::Point to = t.apply(corner);
            EXPECT_TRUE(to.x == 0 || to.x == 360) << to.x;
            EXPECT_TRUE(to.y == 0 || to.y == 640) << to.y;
        }
    }
}

TEST_F(Opening, PixelsThatAreNotSquareAreWidened)
{
    ASSERT_EQ(open(movie("non-square.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(asset->tracks()[0].naturalSize, (base::Size{640, 240}));
    EXPECT_EQ(player->currentFrame()->displaySize(), (base::Size{640, 240}));
}

TEST_F(Opening, DurationsHonourEditListsAndOffsets)
{
    EXPECT_NEAR(durationOf("edit-list.mp4"), 3, 1e-9);
    EXPECT_NEAR(durationOf("start-offset.mp4"), 5.5, 1e-9);
    EXPECT_NEAR(durationOf("long-gop.mp4"), 20, 1e-9);
    EXPECT_NEAR(durationOf("one-frame.mp4"), 1.0 / 30, 1e-4);
    EXPECT_NEAR(durationOf("size-change.ts"), 2, 1e-3);
    EXPECT_NEAR(durationOf("vfr.mkv"), 5, 0.03);
    EXPECT_NEAR(durationOf("vp9.webm"), 2, 0.02);
}

TEST_F(Opening, TheFirstPictureIsShownAsSoonAsTheItemIsReady)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 0);
    ASSERT_EQ(open(movie("edit-list.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 30);
    ASSERT_EQ(open(movie("start-offset.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 0);
}

TEST_F(Opening, AMovieOfSoundAloneIsReadyAndHasNoPicture)
{
    EXPECT_NEAR(durationOf("audio-only.m4a"), 4, 0.03);
    EXPECT_EQ(player->currentFrame(), nullptr);
    EXPECT_EQ(asset->tracks().size(), 2u);
    EXPECT_TRUE(asset->tracksWithMediaType(MediaType::Video).empty());
}

TEST_F(Opening, WhatIsNoMovieFailsInWordsThatNameTheFile)
{
    expectFailure(movie("empty.mp4"));
    expectFailure(movie("not-a-movie.mp4"));
    expectFailure(movie("no-moov.mp4"));
    expectFailure(movie("no-such-file.mp4"));
    expectFailure(movie(""));
    expectFailure("/dev/zero");
    expectFailure("/dev/null");
}

TEST_F(Opening, WhatIsNoMovieFailsInPlainWords)
{
    const auto words = [&](const char* name) {
        EXPECT_EQ(open(movie(name)), Status::Failed) << name;
        return item->error() ? item->error()->description() : "";
    };
    EXPECT_EQ(words("not-a-movie.mp4"),
              "“not-a-movie.mp4” is not a movie that can be opened: it is damaged, or of a kind "
              "that is not known here.");
    EXPECT_NE(words("no-moov.mp4").find("its index is missing"), std::string::npos);
    EXPECT_NE(words("many-tracks.mp4").find("it has more than 64 tracks"), std::string::npos);
    EXPECT_NE(words("bare.h264").find("it does not say when its pictures are shown"), std::string::npos);
    EXPECT_EQ(open(movie("others.mkv")), Status::ReadyToPlay);
}

TEST_F(Opening, WhatIsNoMovieFailsWithAMessageForPeopleToo)
{
    const auto message = [&](const std::string& path) {
        EXPECT_EQ(open(path), Status::Failed) << path;
        if (!item->error())
            return std::string();
        const auto& places = item->error()->userInfo();
        const auto name = places.find("name");
        const auto key = places.find(base::Error::kMessageKey);
        return (key == places.end() ? "" : key->second) + " " + (name == places.end() ? "" : name->second);
    };
    EXPECT_EQ(message(movie("not-a-movie.mp4")), "MOVIE_DAMAGED not-a-movie.mp4");
    EXPECT_EQ(message(movie("no-moov.mp4")), "MOVIE_WITHOUT_INDEX no-moov.mp4");
    EXPECT_EQ(message(movie("many-tracks.mp4")), "MOVIE_TOO_MANY_TRACKS many-tracks.mp4");
    EXPECT_EQ(message(movie("bare.h264")), "MOVIE_WITHOUT_TIMES bare.h264");
    EXPECT_EQ(message(movie("no-such-file.mp4")), "MOVIE_GONE no-such-file.mp4");
    EXPECT_EQ(message("/dev/null"), "MOVIE_NOT_A_FILE null");
    EXPECT_EQ(message(movie("")), "MOVIE_NOT_A_FILE ");
}

TEST_F(Opening, APipeDoesNotHoldAnybodyUp)
{
    const tests::PrivateDirectory directory;
    const std::string path = directory.path() / "a-pipe.mp4";
    ASSERT_EQ(std::system(("mkfifo " + path).c_str()), 0);
    expectFailure(path);
    std::filesystem::remove(path);
}

TEST_F(Opening, APlaylistDoesNotReachOtherFiles)
{
    const tests::PrivateDirectory directory;
    const std::string path = directory.path() / "list.mp4";
    std::ofstream(path) << "#EXTM3U\n#EXT-X-TARGETDURATION:4\n#EXTINF:4,\n"
                        << movie("clock.mp4") << "\n#EXT-X-ENDLIST\n";
    expectFailure(path);
    std::ofstream(path) << "ffconcat version 1.0\nfile " << movie("clock.mp4") << "\n";
    expectFailure(path);
    std::filesystem::remove(path);
}

TEST_F(Opening, NoUrlFails)
{
    const auto none = media.assetWithURL(std::nullopt);
    EXPECT_FALSE(none->url());
    const auto nothing = media.playerItemWithAsset(none);
    EXPECT_EQ(nothing->status(), Status::Unknown);
    ASSERT_TRUE(waitFor([&] { return nothing->status() != Status::Unknown; }));
    EXPECT_EQ(nothing->status(), Status::Failed);
    EXPECT_TRUE(nothing->error());
}

TEST_F(Opening, AMovieStaysReadableForAllAssetsOfItsUrlAfterItsFileIsGone)
{
    const tests::PrivateDirectory directory;
    const std::string path = directory.path() / "gone.mp4";
    std::filesystem::copy_file(movie("clock.mp4"), path, std::filesystem::copy_options::overwrite_existing);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    const auto keep = asset;
    std::filesystem::remove(path);
    EXPECT_EQ(numberAt(at(2)), 60);
    ASSERT_EQ(open(path), Status::ReadyToPlay) << "the first asset still holds it open";
    EXPECT_EQ(numberAt(at(3)), 90);
}

TEST_F(Opening, AnotherFileAtTheSamePathIsAnotherMovie)
{
    const tests::PrivateDirectory directory;
    const std::string path = directory.path() / "replaced.mp4";
    std::filesystem::copy_file(movie("clock.mp4"), path, std::filesystem::copy_options::overwrite_existing);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    const auto keep = asset;
    std::filesystem::remove(path);
    std::filesystem::copy_file(movie("portrait.mp4"), path);
    ASSERT_EQ(open(path), Status::ReadyToPlay);
    EXPECT_EQ(asset->tracks()[0].naturalSize, (base::Size{360, 640}));
    EXPECT_EQ(keep->tracks()[0].naturalSize, (base::Size{640, 360}));
    std::filesystem::remove(path);
}

TEST_F(Opening, PathsAreResolvedBeforeTheyAreOpened)
{
    ffmpeg::Options options;
    options.resolvePath = [](const std::string& path) { return tests::movie(path.substr(8)); };
    ffmpeg::FFmpegMediaFramework mounted(system, center, options);
    const auto found = mounted.playerItemWithAsset(mounted.assetWithURL(base::Url::fromPath("/device/clock.mp4")));
    ASSERT_TRUE(waitFor([&] { return found->status() != Status::Unknown; }));
    EXPECT_EQ(found->status(), Status::ReadyToPlay);
    EXPECT_EQ(found->asset()->url()->path(), "/device/clock.mp4");
}

TEST_F(Opening, WhoLeavesWhileItOpensIsNotCalled)
{
    KeyLog keys;
    for (int i = 0; i < 20; ++i) {
        auto leaving = media.playerItemWithAsset(media.assetWithURL(base::Url::fromPath(movie("long-gop.mp4"))));
        leaving->addObserver(keys, platform::PlayerItem::kStatusKey);
        const auto played = media.playerWithPlayerItem(leaving);
        played->play();
    }
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_TRUE(keys.keys.empty());
}

} // namespace
