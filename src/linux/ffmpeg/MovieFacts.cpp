#include "linux/ffmpeg/MovieFacts.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace ffmpeg {

namespace {

struct Entry {
    std::int64_t tick;
    std::int64_t bytes;
    bool isKey;
    bool isShown; ///< no edit list hides it
};

std::string textOf(const char* text)
{
    return text ? text : "";
}

std::string metadata(AVDictionary* from, const char* key)
{
    const AVDictionaryEntry* found = av_dict_get(from, key, nullptr, 0);
    return found ? textOf(found->value) : "";
}

std::string containerOf(Demuxer& demuxer)
{
    const AVFormatContext& context = demuxer.context();
    if (!demuxer.isMov())
        return textOf(context.iformat->long_name);
    return metadata(context.metadata, "major_brand") == "qt  " ? "QuickTime" : "MP4";
}

std::string titleOf(const AVStream& stream)
{
    const std::string title = metadata(stream.metadata, "title");
    const std::string handler = metadata(stream.metadata, "handler_name");
    // What writers call every sound track is no title.
    const bool isUsual = handler == "SoundHandler" || handler == "Sound Media Handler" || handler == "Core Media Audio";
    return !title.empty() || isUsual ? title : handler;
}

/// By time. The table of a file that has a whole one tells as much as all its packets; its times are those of decoding,
/// whose distances are the same.
base::Result<std::vector<Entry>> entriesOf(const Movie& movie, Demuxer& demuxer, const Cancelled& cancelled)
{
    std::vector<Entry> entries;
    AVStream& stream = demuxer.stream(movie.video()->stream);
    const int count = avformat_index_get_entries_count(&stream);
    if (demuxer.isMov() && !movie.durationBeforeCut() && count > 0 && count >= stream.nb_frames
        && stream.nb_frames > 0) {
        for (int i = 0; i < count; ++i) {
            const AVIndexEntry* each = avformat_index_get_entry(&stream, i);
            entries.push_back({each->timestamp, each->size, (each->flags & AVINDEX_KEYFRAME) != 0,
                               (each->flags & AVINDEX_DISCARD_FRAME) == 0});
        }
        return entries;
    }
    const auto index = movie.packetIndex(cancelled);
    if (!index)
        return base::Error::make("ffmpeg", AVERROR_EXIT, "“" + movie.file()->name() + "” cannot be read to its end.");
    for (const PacketEntry& each : index->packets())
        entries.push_back({each.pts, each.size, each.isKey, !each.isHidden});
    return entries;
}

void describeTimes(PictureFacts& facts, const std::vector<Entry>& entries, AVRational timeBase, double duration)
{
    std::vector<std::int64_t> steps;
    std::vector<std::int64_t> groups;
    const Entry* first = nullptr;
    const Entry* last = nullptr;
    const Entry* keyframe = nullptr;
    std::int64_t bytes = 0;
    for (const Entry& each : entries) {
        bytes += each.bytes;
        if (each.isShown) {
            ++facts.count;
            if (last)
                steps.push_back(each.tick - last->tick);
            first = first ? first : &each;
            last = &each;
        }
        if (each.isKey) {
            ++facts.keyframes;
            if (keyframe)
                groups.push_back(each.tick - keyframe->tick);
            keyframe = &each;
        }
    }
    const double tick = av_q2d(timeBase);
    if (duration > 0)
        facts.bitRate = std::llround(static_cast<double>(bytes) * 8 / duration);
    if (!steps.empty()) {
        const auto [least, most] = std::minmax_element(steps.begin(), steps.end());
        facts.shortest = static_cast<double>(*least) * tick;
        facts.longest = static_cast<double>(*most) * tick;
        facts.isVariable = *most - *least > 1;
        const double whole = static_cast<double>(last->tick - first->tick) * tick;
        facts.rate = whole > 0 ? static_cast<double>(steps.size()) / whole : 0;
    }
    if (!groups.empty()) {
        std::sort(groups.begin(), groups.end());
        facts.shortestGroup = static_cast<double>(groups.front()) * tick;
        facts.medianGroup = static_cast<double>(groups[groups.size() / 2]) * tick;
        facts.longestGroup = static_cast<double>(groups.back()) * tick;
    }
}

PictureFacts pictureOf(const Movie& movie, const AVStream& stream)
{
    const AVCodecParameters& coded = *stream.codecpar;
    const DecodedFrame& first = *movie.firstFrame();
    PictureFacts facts;
    facts.codec = avcodec_get_name(coded.codec_id);
    facts.profile = textOf(avcodec_profile_name(coded.codec_id, coded.profile));
    facts.format = textOf(av_get_pix_fmt_name(static_cast<AVPixelFormat>(first.picture().format)));
    facts.width = first.picture().width;
    facts.height = first.picture().height;
    facts.displayWidth = static_cast<int>(first.displaySize().width);
    facts.displayHeight = static_cast<int>(first.displaySize().height);
    const base::AffineTransform turn = preferredTransform(stream, {double(facts.width), double(facts.height)});
    const double quarters = std::atan2(turn.b, turn.a) / std::acos(0.0);
    facts.rotation = (static_cast<int>(std::lround(quarters)) + 4) % 4 * 90;
    return facts;
}

SoundFacts soundOf(const AVStream& stream)
{
    const AVCodecParameters& coded = *stream.codecpar;
    SoundFacts facts;
    facts.codec = avcodec_get_name(coded.codec_id);
    facts.title = titleOf(stream);
    facts.language = metadata(stream.metadata, "language");
    if (facts.language == "und")
        facts.language.clear();
    facts.channels = coded.ch_layout.nb_channels;
    AVChannelLayout layout = {};
    av_channel_layout_copy(&layout, &coded.ch_layout);
    if (layout.order == AV_CHANNEL_ORDER_UNSPEC) // as it is played
        av_channel_layout_default(&layout, facts.channels);
    char text[64] = {};
    av_channel_layout_describe(&layout, text, sizeof text);
    av_channel_layout_uninit(&layout);
    facts.layout = text;
    facts.rate = coded.sample_rate;
    facts.bitRate = coded.bit_rate;
    facts.isHeard = avcodec_find_decoder(coded.codec_id) != nullptr;
    return facts;
}

} // namespace

base::Result<MovieFacts> MovieFacts::of(const Movie& movie, const Cancelled& cancelled)
{
    // One of its own: the movie's spare is for whoever reads on.
    const auto opened = Demuxer::open(movie.file(), cancelled);
    if (!opened)
        return opened.error();
    Demuxer& demuxer = *opened.value();
    demuxer.lookAtPackets(); // profiles and layouts; all else is known without it
    MovieFacts facts;
    facts.container = containerOf(demuxer);
    facts.duration = movie.duration().isNumeric() ? movie.duration().seconds() : 0;
    facts.isCutOff = movie.durationBeforeCut().has_value();
    if (facts.isCutOff && movie.durationBeforeCut()->isNumeric())
        facts.durationBeforeCut = movie.durationBeforeCut()->seconds();
    facts.bytes = movie.file()->size();
    if (facts.duration > 0)
        facts.bitRate = std::llround(static_cast<double>(facts.bytes) * 8 / facts.duration);
    const int shown = movie.video() ? movie.video()->stream : -1;
    for (int i = 0; i < demuxer.streamCount(); ++i) {
        const AVStream& stream = demuxer.stream(i);
        if (i == shown)
            facts.picture = pictureOf(movie, stream);
        else if (stream.codecpar->codec_type == AVMEDIA_TYPE_AUDIO)
            facts.sounds.push_back(soundOf(stream));
        else
            facts.others.push_back({textOf(av_get_media_type_string(stream.codecpar->codec_type)),
                                    avcodec_get_name(stream.codecpar->codec_id)});
    }
    if (facts.picture) {
        const auto entries = entriesOf(movie, demuxer, cancelled);
        if (!entries)
            return entries.error();
        describeTimes(*facts.picture, entries.value(), demuxer.stream(shown).time_base, facts.duration);
    }
    return facts;
}

} // namespace ffmpeg
