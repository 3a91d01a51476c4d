#include "linux/ffmpeg/exporting/ExportJob.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/output/MovieWriter.h"
#include "linux/ffmpeg/exporting/output/OutputCheck.h"
#include "linux/ffmpeg/exporting/output/OutputFile.h"
#include "linux/ffmpeg/exporting/sound/SoundSources.h"
#include "linux/ffmpeg/exporting/video/VideoSources.h"

#include <algorithm>
#include <cmath>
#include <future>
#include <mutex>
#include <set>
#include <utility>

namespace ffmpeg {

using base::Error;
using base::MediaTime;
using base::Result;

namespace {

/// Packets more than the range's share of the movie's: where it has more of them than elsewhere, and at its edges.
constexpr double kMoreThanShare = 1.2;
constexpr std::int64_t kSparePackets = 2000;

MediaTime earlier(MediaTime a, MediaTime b)
{
    return a < b ? a : b;
}

/// The part of `range` that lies in the movie, in the movie's own ticks.
Result<ExportRange> rangeIn(const Movie& movie, const std::optional<base::MediaTimeRange>& range)
{
    const MediaTime zero = MediaTime::make(0, movie.timescale());
    const MediaTime whole = movie.duration();
    const std::string name = "“" + movie.file()->name() + "”";
    const auto failed = [&](const std::string& why) {
        return Error::make("ffmpeg", AVERROR(EINVAL), name + " cannot be exported: " + why + ".");
    };
    if (!range)
        return whole > zero ? Result<ExportRange>(ExportRange{zero, whole}) : failed("it has no length");
    if (!range->start.isNumeric() || !(range->duration > zero))
        return failed("the range has no length");
    if (range->start >= whole)
        return failed("the range begins behind its end");
    MediaTime start = range->start.convertedTo(movie.timescale());
    MediaTime end = earlier(range->end(), whole).convertedTo(movie.timescale());
    if (!(end > zero))
        return failed("the range ends before its beginning");
    start = start < zero ? zero : start;
    if (!(end > start))
        return failed("the range is too short");
    return ExportRange{start, end};
}

class Attempt {
public:
    Attempt(const ExportJob& job, const ExportRange& range, OutputFile& file) : m_job(job), m_range(range), m_file(file)
    {
    }

    Result<void> run(VideoMode mode, SoundMode soundMode)
    {
        const Movie& movie = *m_job.movie;
        const TellLog log = [this](const std::string& line) { tellOnce(line); };
        // The sound is looked at meanwhile. When the pictures cannot be copied it is as good for the next attempt.
        if (!m_sounds.valid())
            m_sounds = std::async(std::launch::async, [this, soundMode, log] {
                auto opened = openSoundSources(m_job.movie, m_range, m_job.mix, soundMode, m_job.cancelled, log);
                if (opened)
                    for (const auto& each : opened.value())
                        each->detach();
                return opened;
            });
        std::vector<std::unique_ptr<TrackSource>> tracks;
        if (movie.video()) {
            auto video = openVideoSource(m_job.movie, m_range, mode, m_job.cancelled, log);
            if (!video)
                return video.error();
            tracks.push_back(std::move(video).value());
        }
        auto sounds = m_sounds.get();
        if (!sounds)
            return sounds.error();
        for (auto& each : sounds.value())
            tracks.push_back(std::move(each));
        if (tracks.empty())
            return Error::make("ffmpeg", AVERROR_STREAM_NOT_FOUND, "nothing of it can be exported");

        const double seconds = (m_range.end - m_range.start).seconds();
        const double share = std::min(1.0, seconds / movie.duration().seconds() * kMoreThanShare);
        const auto packets = std::llround(static_cast<double>(movie.likelyPackets()) * share) + kSparePackets;
        const auto written = writeMovie({m_file, tracks, movie.metadata(), movie.video() ? movie.timescale() : 0,
                                         packets, seconds, m_job.cancelled, m_job.progress});
        if (!written)
            return written.error();
        for (const TrackSummary& each : written.value())
            if (each.packets == 0)
                log(std::string(each.type == AVMEDIA_TYPE_VIDEO ? "The picture track" : "A sound track") + " of “"
                    + movie.file()->name() + "” is left out: there is nothing of it in the range.");
        m_file.sendToDisk(); // while it is checked
        return checkOutput(m_file, written.value(), m_job.cancelled);
    }

private:
    /// The next attempt finds again what this one says.
    void tellOnce(const std::string& line)
    {
        const std::lock_guard lock(m_mutex);
        if (m_told.insert(line).second)
            m_job.log->message(line);
    }

    const ExportJob& m_job;
    const ExportRange& m_range;
    OutputFile& m_file;
    std::mutex m_mutex;
    std::set<std::string> m_told;
    std::future<Result<std::vector<std::unique_ptr<TrackSource>>>> m_sounds;
};

/// Errors of reading and encoding do not name the movie; those of writing name the output.
base::ErrorRef named(const Movie& movie, const base::ErrorRef& error)
{
    if (error->description().starts_with("“"))
        return error;
    return Error::make(error->domain(), error->code(),
                       "“" + movie.file()->name() + "” cannot be exported: " + error->description() + ".");
}

std::string whatStays(const Movie& movie)
{
    std::string names;
    for (const std::string& each : movie.otherTracks())
        names += (names.empty() ? "" : ", ") + each;
    return "Of “" + movie.file()->name() + "” does not come along: " + names + ".";
}

/// Whoever reads takes the first place that cannot be read for the movie's end, and knows nothing of bytes that became
/// others: what was made then is not the movie. Null when the file was whole all the time.
base::ErrorRef whyNotWhole(const OpenFile& file, int failedReadsBefore)
{
    const std::string begin = "“" + file.name() + "” cannot be exported: ";
    if (file.hasChanged())
        return Error::make("ffmpeg", AVERROR(EBUSY),
                           begin + "it was changed meanwhile; try again when nothing writes to it any more.");
    if (file.failedReads() != failedReadsBefore)
        return Error::make("ffmpeg", AVERROR(EIO),
                           begin
                               + "it cannot be read to its end, because its disk or the way to it fails; "
                                 "copy it to another one and try again.");
    return nullptr;
}

} // namespace

Result<void> ExportJob::run() const
{
    const int failedReads = movie->file()->failedReads();
    if (const auto missing = movie->whatIsMissing())
        log->message(*missing);
    const auto found = rangeIn(*movie, range);
    if (!found)
        return found.error();
    const auto file = OutputFile::create(output, movie->file());
    if (!file)
        return file.error();
    if (!movie->otherTracks().empty())
        log->message(whatStays(*movie));
    Attempt attempt(*this, found.value(), *file.value());
    VideoMode video = movie->video() ? VideoMode::Copy : VideoMode::Encode;
    SoundMode sound = SoundMode::Copy;
    const auto attempted = [&] {
        Result<void> done = attempt.run(video, sound);
        const auto why = *cancelled ? nullptr : whyNotWhole(*movie->file(), failedReads);
        return why ? Result<void>(why) : done;
    };
    Result<void> done = attempted();
    while (!done && !*cancelled) {
        const std::string name = "“" + movie->file()->name() + "” is encoded as a whole: ";
        if (saysCannotCopy(done.error()) && video == VideoMode::Copy)
            video = VideoMode::Encode;
        else if (saysCannotCopySound(done.error()) && sound == SoundMode::Copy)
            sound = SoundMode::Encode;
        else
            break;
        log->message((saysCannotCopySound(done.error()) ? "The sound of " : "") + name + done.error()->description()
                     + ".");
        if (auto cleared = file.value()->clear(); !cleared)
            return cleared;
        done = attempted();
    }
    if (*cancelled)
        return Error::make("ffmpeg", AVERROR_EXIT, "it is no longer wanted");
    if (!done)
        return named(*movie, done.error());
    return file.value()->publish();
}

} // namespace ffmpeg
