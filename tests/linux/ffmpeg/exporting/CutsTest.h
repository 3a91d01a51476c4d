/// A fixture that cuts a movie and compares what comes out with it: every picture, its time, and every sound.
#pragma once

#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/sound/DecodedSound.h"

#include <algorithm>
#include <cmath>
#include <set>

namespace tests {

class CutsTest : public ExportTest {
protected:
    static constexpr double kTolerance = 0.001; // seconds
    static constexpr double kAlike = 45;        // dB

    /// What is expected of a range: the source's pictures with the times that they have in it.
    struct Expected {
        const DecodedPicture* picture;
        double seconds;
    };

    /// Opens a movie and decodes it: once, for all of its cuts.
    void take(const std::string& path)
    {
        ASSERT_EQ(open(path), Status::ReadyToPlay);
        movie = path;
        DecodedMovie decoded(path);
        source = decoded.all();
        ASSERT_FALSE(source.empty());
        // These begin at 0 whatever comes first; others where their first packet does.
        const bool beginsAtZero =
            path.ends_with(".mp4") || path.ends_with(".mov") || path.ends_with(".mkv") || path.ends_with(".webm");
        const double origin = beginsAtZero ? 0 : double(decoded.context().start_time) / AV_TIME_BASE;
        for (DecodedPicture& each : source)
            each.seconds -= origin;
        const auto tracks = asset->tracks();
        const auto count = std::count_if(tracks.begin(), tracks.end(), [](const platform::AssetTrack& track) {
            return track.type == platform::MediaType::Audio;
        });
        for (int i = 0; i < static_cast<int>(count); ++i)
            sounds.push_back(decodeSound(path, i));
        for (DecodedSound& each : sounds)
            each.start -= std::llround(origin * each.rate);
    }

    std::vector<Expected> expected(double start, double end) const
    {
        std::vector<Expected> pictures;
        for (const DecodedPicture& each : source) {
            if (each.seconds >= end - 1e-7)
                break;
            if (each.seconds <= start + 1e-7)
                pictures.clear();
            pictures.push_back({&each, std::max(0.0, each.seconds - start)});
        }
        return pictures;
    }

    /// Cuts the movie and looks at everything; `start` and `end` in seconds.
    void cutAndCheck(double start, double end)
    {
        SCOPED_TRACE(std::to_string(start) + " to " + std::to_string(end));
        const Range range{at(start), at(end) - at(start)};
        ASSERT_EQ(cut(movie, output(), range), ExportStatus::Completed) << errorText();
        const std::int32_t ticks = asset->duration().timescale;
        start = range.start.convertedTo(ticks).seconds();
        end = range.end().convertedTo(ticks).seconds();
        checkPictures(start, end);
        if (!HasFatalFailure())
            checkSounds(start, end);
        if (!HasFatalFailure())
            checkFile();
        std::filesystem::remove(output());
    }

    /// What more is to be seen of the output.
    virtual void checkFile() {}

    /// Pictures that are the source's, bit for bit, in all cuts together.
    int copies = 0;
    /// By how much sound was late or early at most, in seconds.
    double worstLateness = 0;
    /// How loud it is where sound was removed, as a part of the sound around the cut.
    double worstRemains = 0;

    std::string movie;
    std::vector<DecodedPicture> source;
    std::vector<DecodedSound> sounds;

private:
    void checkPictures(double start, double end)
    {
        const auto wanted = expected(start, end);
        const Complaints complaints;
        DecodedMovie decoded(output());
        ASSERT_TRUE(decoded.isGood());
        const auto got = decoded.all();
        EXPECT_EQ(Complaints::texts(), "");
        EXPECT_EQ(decoded.refused(), 0);
        ASSERT_EQ(got.size(), wanted.size());
        std::set<int> shown;
        for (std::size_t i = 0; i < got.size(); ++i) {
            ASSERT_EQ(got[i].number, wanted[i].picture->number) << "picture " << i;
            ASSERT_NEAR(got[i].seconds, wanted[i].seconds, kTolerance) << "picture " << i;
            const bool isCopy = got[i].hash == wanted[i].picture->hash;
            copies += isCopy;
            ASSERT_TRUE(isCopy || likeness(got[i], *wanted[i].picture) > kAlike)
                << "picture " << i << ": " << likeness(got[i], *wanted[i].picture) << " dB";
            shown.insert(got[i].number);
        }
        const double last = wanted.back().seconds;
        const double length = double(decoded.context().duration) / AV_TIME_BASE;
        EXPECT_GT(length, last);
        EXPECT_LE(length, end - start + 0.002);
        checkHidden(decoded.shown(), shown);
        for (const double part : {0.9, 0.1, 0.5}) {
            const std::size_t which = std::size_t(part * double(got.size()));
            EXPECT_EQ(decoded.numberAfterSeeking(got[which].seconds), got[which].number);
        }
    }

    /// What an edit list hides is there too when it is ignored; where it hides no packet there is nothing to see.
    void checkHidden(int packetsShown, const std::set<int>& shown)
    {
        if (DecodedMovie(output(), DecodedMovie::Edits::Ignore).rest() == packetsShown)
            return;
        for (const DecodedPicture& each :
             DecodedMovie(output(), DecodedMovie::Edits::Ignore).all(DecodedMovie::Look::AtNumbers))
            EXPECT_TRUE(shown.contains(each.number)) << each.number << " was removed";
    }

    void checkSounds(double start, double end)
    {
        int track = 0; // of the output: one that has no sound in the range is left out
        for (std::size_t i = 0; i < sounds.size(); ++i) {
            SCOPED_TRACE("sound track " + std::to_string(i + 1));
            const DecodedSound& was = sounds[i];
            const std::int64_t from = std::llround(start * was.rate);
            const std::int64_t until = std::llround(end * was.rate);
            const std::int64_t heardFrom = std::max(from, was.start);
            const std::int64_t heardUntil = std::min(until, was.start + std::int64_t(was.length()));
            if (heardUntil - heardFrom > was.rate / 20)
                checkSound(was, track++, from, until);
            else if (heardUntil > heardFrom)
                return; // so little that it may be left out
        }
    }

    /// `from` up to `until` is what shall be heard, in samples of the movie.
    void checkSound(const DecodedSound& was, int track, std::int64_t from, std::int64_t until)
    {
        const DecodedSound heard = decodeSound(output(), track);
        ASSERT_EQ(heard.rate, was.rate);
        ASSERT_EQ(heard.channels.size(), was.channels.size());
        EXPECT_EQ(heard.errors, 0);
        const std::int64_t first = std::max(from, was.start);
        const std::int64_t last = std::min(until, was.start + std::int64_t(was.length()));

        // At both ends and in the middle it is where it was, and as loud.
        const std::int64_t window = std::min<std::int64_t>(was.rate / 16, last - first);
        for (const std::int64_t place : {first, (first + last - window) / 2, last - window}) {
            double alike = 0;
            const std::int64_t late = latenessOf(heard, place - from, was, place, window, was.rate / 150, &alike);
            worstLateness = std::max(worstLateness, double(std::abs(late)) / was.rate);
            EXPECT_LE(std::abs(late), was.rate / 200) << "samples at " << double(place) / was.rate;
            EXPECT_GT(alike, 0.95) << "at " << double(place) / was.rate;
            EXPECT_NEAR(decibels(loudnessOf(heard, place - from + late, window) / loudnessOf(was, place, window)), 0,
                        0.3);
        }

        // What a player hides is there too when it ignores edit lists: none of it is what was removed.
        DecodedSound all = decodeSound(output(), track, true);
        all.start = heard.firstPts;
        ASSERT_EQ(all.at(window, 0), heard.at(window, 0)) << "the same, at the same place";
        const std::int64_t end = all.start + std::int64_t(all.length());
        EXPECT_GT(all.start, -was.rate / 10);
        EXPECT_LT(end, until - from + was.rate / 10);
        const auto loudnessAround = [&](std::int64_t edge) { return loudnessOf(was, edge - window / 2, window); };
        checkRemoved(all, all.start, 0, loudnessAround(from));
        checkRemoved(all, until - from, end, loudnessAround(until));
    }

    /// From one place up to another in the output there is nothing but what a codec smears.
    void checkRemoved(const DecodedSound& all, std::int64_t first, std::int64_t last, double loudness)
    {
        if (last - first < all.rate / 1000 || loudness == 0)
            return;
        const double rest = loudnessOf(all, first, last - first) / loudness;
        worstRemains = std::max(worstRemains, rest);
        EXPECT_LT(rest, 0.1) << "from " << first << " to " << last;
    }

    static double loudnessOf(const DecodedSound& sound, std::int64_t from, std::int64_t count)
    {
        double sum = 0;
        for (std::int64_t i = from; i < from + count; ++i)
            sum += std::pow(double(sound.at(i, 0)), 2);
        return std::sqrt(sum / double(count));
    }
};

} // namespace tests
