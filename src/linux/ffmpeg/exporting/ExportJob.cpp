#include "linux/ffmpeg/exporting/ExportJob.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/output/MovieWriter.h"
#include "linux/ffmpeg/exporting/output/OutputCheck.h"
#include "linux/ffmpeg/exporting/output/OutputFile.h"
#include "linux/ffmpeg/exporting/sound/SoundSources.h"
#include "linux/ffmpeg/exporting/video/VideoSources.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace ffmpeg {

using base::Error;
using base::MediaTime;
using base::Result;

namespace {

/// Of both kinds of streams, where a file does not count them beforehand: more than recordings have.
constexpr double kPicturesASecond = 61;
constexpr double kSoundPacketsASecond = 102;
constexpr std::int64_t kSpare = 600; ///< packets beside what is counted: at the edges of the range

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

/// What the whole file says, and how much of it there is.
struct Facts {
    AVDictionary* metadata = nullptr;
    std::int64_t packets = 0;

    Facts() = default;
    Facts(const Facts&) = delete;
    Facts& operator=(const Facts&) = delete;
    ~Facts() { av_dict_free(&metadata); }

    Result<void> find(const Movie& movie, const Cancelled& cancelled, double share)
    {
        const auto demuxer = movie.demuxer(cancelled);
        if (!demuxer)
            return demuxer.error();
        av_dict_copy(&metadata, demuxer.value()->context().metadata, 0);
        for (int i = 0; i < demuxer.value()->streamCount(); ++i) {
            const AVStream& stream = demuxer.value()->stream(i);
            const bool isPicture = stream.codecpar->codec_type == AVMEDIA_TYPE_VIDEO;
            const double usual = movie.duration().seconds() * (isPicture ? kPicturesASecond : kSoundPacketsASecond);
            const double counted = demuxer.value()->isMov() ? avformat_index_get_entries_count(&stream) : 0;
            packets += std::llround((counted > 0 ? counted : usual) * share) + kSpare;
        }
        return {};
    }
};

class Attempt {
public:
    Attempt(const ExportJob& job, const ExportRange& range, OutputFile& file) : m_job(job), m_range(range), m_file(file)
    {
    }

    Result<void> run(VideoMode mode)
    {
        const Movie& movie = *m_job.movie;
        const TellLog log = [this](const std::string& line) { m_job.log->message(line); };
        std::vector<std::unique_ptr<TrackSource>> tracks;
        if (movie.video()) {
            auto video = openVideoSource(m_job.movie, m_range, mode, m_job.cancelled, log);
            if (!video)
                return video.error();
            tracks.push_back(std::move(video).value());
        }
        auto sounds = openSoundSources(m_job.movie, m_range, m_job.mix, m_job.cancelled, log);
        if (!sounds)
            return sounds.error();
        for (auto& each : sounds.value())
            tracks.push_back(std::move(each));
        if (tracks.empty())
            return Error::make("ffmpeg", AVERROR_STREAM_NOT_FOUND, "nothing of it can be exported");

        const double seconds = (m_range.end - m_range.start).seconds();
        Facts facts;
        if (auto found = facts.find(movie, m_job.cancelled, std::min(1.0, seconds / movie.duration().seconds() * 1.2));
            !found)
            return found;
        const auto written = writeMovie({m_file, tracks, facts.metadata, movie.video() ? movie.timescale() : 0,
                                         facts.packets, seconds, m_job.cancelled, m_job.progress});
        if (!written)
            return written.error();
        const auto checked = checkOutput(m_file, written.value(), m_job.cancelled);
        if (!checked && mode == VideoMode::Copy && movie.video())
            return cannotCopy(checked.error()->description());
        return checked;
    }

private:
    const ExportJob& m_job;
    const ExportRange& m_range;
    OutputFile& m_file;
};

/// Errors of reading and encoding do not name the movie; those of writing name the output.
base::ErrorRef named(const Movie& movie, const base::ErrorRef& error)
{
    if (error->description().starts_with("“"))
        return error;
    return Error::make(error->domain(), error->code(),
                       "“" + movie.file()->name() + "” cannot be exported: " + error->description() + ".");
}

} // namespace

Result<void> ExportJob::run() const
{
    const auto found = rangeIn(*movie, range);
    if (!found)
        return found.error();
    const auto file = OutputFile::create(output, movie->file());
    if (!file)
        return file.error();
    Attempt attempt(*this, found.value(), *file.value());
    Result<void> done = attempt.run(VideoMode::Copy);
    if (saysCannotCopy(done.error()) && !*cancelled) {
        log->message("“" + movie->file()->name() + "” is encoded as a whole: " + done.error()->description() + ".");
        if (auto cleared = file.value()->clear(); !cleared)
            return cleared;
        done = attempt.run(VideoMode::Encode);
    }
    if (*cancelled)
        return Error::make("ffmpeg", AVERROR_EXIT, "it is no longer wanted");
    if (!done)
        return named(*movie, done.error());
    return file.value()->publish();
}

} // namespace ffmpeg
