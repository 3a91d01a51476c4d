#include "linux/ffmpeg/exporting/output/OutputCheck.h"

#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/VideoDecoder.h"
#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <set>
#include <string>

namespace ffmpeg {

using base::Result;

namespace {

constexpr double kTolerance = 0.001; ///< seconds; clocks of movie and tracks round

constexpr const char* kWrong = "the exported movie is not as it should be: ";

base::ErrorRef wrong(const std::string& what)
{
    return cannotCopy(kWrong + what);
}

/// `which` counts from 0.
base::ErrorRef wrong(const TrackSummary& track, int which, const std::string& what)
{
    const std::string reason = kWrong + ("track " + std::to_string(which + 1)) + what;
    return track.type == AVMEDIA_TYPE_AUDIO ? cannotCopySound(reason) : cannotCopy(reason);
}

bool areFar(std::int64_t a, AVRational aTicks, double seconds)
{
    return std::abs(static_cast<double>(a) * av_q2d(aTicks) - seconds) > kTolerance;
}

double secondsOf(std::int64_t ticks, const TrackSummary& track)
{
    return static_cast<double>(ticks) * av_q2d(track.timeBase);
}

Result<void> checkBeginnings(Demuxer& demuxer, const std::vector<TrackSummary>& written)
{
    std::set<int> awaited;
    for (std::size_t i = 0; i < written.size(); ++i)
        awaited.insert(static_cast<int>(i));
    const auto packet = newPacket();
    while (!awaited.empty()) {
        if (demuxer.read(*packet) != 0)
            return wrong(written[static_cast<std::size_t>(*awaited.begin())], *awaited.begin(), " is empty");
        if (awaited.erase(packet->stream_index) == 0)
            continue;
        const TrackSummary& track = written[static_cast<std::size_t>(packet->stream_index)];
        if (areFar(packet->pts, demuxer.stream(packet->stream_index).time_base, secondsOf(track.firstPts, track)))
            return wrong(track, packet->stream_index, " begins at the wrong time");
    }
    return {};
}

/// Groups of pictures that were encoded stand beside copied ones: each kind must be decoded by the one header.
Result<void> checkGroups(Demuxer& demuxer, int stream)
{
    AVStream& about = demuxer.stream(stream);
    std::vector<std::int64_t> keyframes;
    for (int i = 0; i < avformat_index_get_entries_count(&about); ++i) {
        const AVIndexEntry* entry = avformat_index_get_entry(&about, i);
        if (entry->flags & AVINDEX_KEYFRAME)
            keyframes.push_back(entry->timestamp);
    }
    if (keyframes.empty())
        return wrong("it has no keyframe");
    VideoTrack track;
    track.stream = stream;
    track.timeBase = about.time_base;
    demuxer.select({stream});
    const auto packet = newPacket();
    for (const std::size_t which :
         std::set<std::size_t>{0, std::min<std::size_t>(1, keyframes.size() - 1), keyframes.size() - 1}) {
        const auto decoder = VideoDecoder::open(about, track, 1);
        if (!decoder)
            return decoder.error();
        if (!demuxer.seek(stream, keyframes[which]) || demuxer.read(*packet) != 0)
            return wrong("it cannot be read from each keyframe");
        decoder.value()->send(*packet);
        decoder.value()->finish();
        if (!decoder.value()->receive())
            return wrong("a group of pictures cannot be decoded");
    }
    return {};
}

/// So many packets of the movie from one on, in the order of decoding.
Result<void> take(Demuxer& demuxer, int stream, const JointSide& side, std::vector<Owned<AVPacket>>& packets)
{
    const AVIndexEntry* first = avformat_index_get_entry(&demuxer.stream(stream), static_cast<int>(side.firstPacket));
    if (!first || !demuxer.seek(stream, first->timestamp))
        return wrong("it cannot be read from each joint");
    const std::int64_t position = first->pos;
    bool isThere = false;
    for (std::int64_t left = side.packets; left > 0;) {
        auto packet = newPacket();
        if (demuxer.read(*packet) != 0)
            return wrong("packets at a joint are missing");
        isThere = isThere || packet->pos == position;
        if (!isThere)
            continue;
        packets.push_back(std::move(packet));
        --left;
    }
    return {};
}

/// Players decode what was encoded and what was copied in one go: by one decoder, which keeps some of what it learnt.
Result<void> checkJoint(Demuxer& demuxer, int stream, const Joint& joint)
{
    std::vector<Owned<AVPacket>> packets;
    std::vector<PictureLook> expected;
    for (const JointSide* side : {&joint.before, &joint.after}) {
        if (auto taken = take(demuxer, stream, *side, packets); side->packets > 0 && !taken)
            return taken;
        expected.insert(expected.end(), side->looks.begin(), side->looks.end());
    }
    const auto seen = looksOf(*demuxer.stream(stream).codecpar, packets);
    if (!seen)
        return seen.error();
    std::erase_if(expected, [](const PictureLook& look) { return look.isDamaged; });
    auto next = expected.begin();
    for (const PictureLook& look : seen.value())
        next += next != expected.end() && next->hash == look.hash;
    return next == expected.end() ? Result<void>() : wrong("pictures beside a joint are not what they should be");
}

} // namespace

Result<void> checkOutput(const OutputFile& file, const std::vector<TrackSummary>& tracks, const Cancelled& cancelled)
{
    // The muxer leaves out a track without packets.
    std::vector<TrackSummary> written;
    std::copy_if(tracks.begin(), tracks.end(), std::back_inserter(written),
                 [](const TrackSummary& each) { return each.packets > 0; });
    const auto again = OpenFile::of(file.descriptor(), file.name());
    if (!again)
        return again.error();
    auto opened = Demuxer::open(again.value(), cancelled);
    if (!opened && cancelled && *cancelled)
        return opened.error();
    if (!opened)
        return wrong("it cannot be opened");
    Demuxer& demuxer = *opened.value();
    if (demuxer.streamCount() != static_cast<int>(written.size()))
        return wrong("not all of its tracks are in it");
    if (auto checked = checkBeginnings(demuxer, written); !checked)
        return checked;
    for (int i = 0; i < demuxer.streamCount(); ++i) {
        const TrackSummary& track = written[static_cast<std::size_t>(i)];
        AVStream& stream = demuxer.stream(i);
        if (avformat_index_get_entries_count(&stream) != track.packets)
            return wrong(track, i, " has not all of its packets");
        if (track.type != AVMEDIA_TYPE_VIDEO)
            continue;
        const AVIndexEntry* last = avformat_index_get_entry(&stream, static_cast<int>(track.packets) - 1);
        if (!last
            || static_cast<double>(last->timestamp) * av_q2d(stream.time_base)
                   > secondsOf(track.lastPts, track) + kTolerance)
            return wrong("its pictures end too late");
        if (auto checked = checkGroups(demuxer, i); !checked)
            return checked;
        for (const Joint& joint : track.joints)
            if (auto checked = checkJoint(demuxer, i, joint); !checked)
                return checked;
    }
    return {};
}

} // namespace ffmpeg
