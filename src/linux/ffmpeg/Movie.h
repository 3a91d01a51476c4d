/// What is known of a movie once it was opened; shared by everything that reads it. Immutable but for what it makes on
/// demand; any thread.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/DecodedFrame.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/PacketIndex.h"
#include "linux/ffmpeg/VideoTrack.h"
#include "platform/media/Asset.h"

#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace ffmpeg {

class Movie {
public:
    /// Reads the header and decodes the first picture; nothing more, because somebody waits for that picture.
    /// A movie that has neither picture nor sound, or whose pictures cannot be decoded, is an error.
    static base::Result<std::shared_ptr<Movie>> open(std::shared_ptr<OpenFile> file, const Cancelled& cancelled);

    const std::shared_ptr<OpenFile>& file() const { return m_file; }
    const std::vector<platform::AssetTrack>& tracks() const { return m_tracks; }
    base::MediaTime duration() const { return m_duration; }
    /// How long it was, as its header says, before its file was cut off; indefinite when that is not known, and
    /// nothing when it is whole as far as one can see.
    const std::optional<base::MediaTime>& durationBeforeCut() const { return m_durationBeforeCut; }
    std::optional<platform::CutOff> cutOff() const;
    /// The same in a sentence, for logs.
    std::optional<std::string> whatIsMissing() const;
    /// Ticks a second of all times that are told.
    std::int32_t timescale() const { return m_video ? m_video->timescale : kSoundTimescale; }
    /// Nothing when there is only sound.
    const std::optional<VideoTrack>& video() const { return m_video; }
    /// How an asset names the track that is in a stream.
    static int trackIDOf(const AVStream& stream) { return stream.id > 0 ? stream.id : stream.index + 1; }
    /// Streams whose sound can be decoded.
    const std::vector<int>& audioStreams() const { return m_audioStreams; }
    /// What else there is, which is neither played nor exported: "subtitles (ass)".
    const std::vector<std::string>& otherTracks() const { return m_otherTracks; }
    /// Where the movie begins, in microseconds of the file's own time.
    std::int64_t origin() const { return m_origin; }
    /// What the file says of itself as a whole; null when it says nothing.
    const AVDictionary* metadata() const { return m_metadata.get(); }
    /// Of all tracks together; where the file does not count them, more than recordings have.
    std::int64_t likelyPackets() const { return m_likelyPackets; }
    /// Null when there is only sound.
    const FrameRef& firstFrame() const { return m_firstFrame; }

    /// A reader of the shared file. The first call gives the one that opened the movie.
    base::Result<std::unique_ptr<Demuxer>> demuxer(Cancelled cancelled) const;
    /// Whether a reader's table finds the keyframes; else the packet index does.
    bool hasTable(const Cancelled& cancelled) const;
    /// Made by the first who asks, while others wait. Null when that was cancelled or the file cannot be read.
    std::shared_ptr<const PacketIndex> packetIndex(const Cancelled& cancelled) const;

private:
    static constexpr std::int32_t kSoundTimescale = 90000;

    void describe();
    base::Result<void> decodeFirstFrame(const Cancelled& cancelled);
    void describeVideo(const AVStream& stream);
    void findOrigin(std::int64_t firstPts, const Cancelled& cancelled);
    base::Result<void> findDuration(const Cancelled& cancelled);
    void noteCut(std::int64_t missing, std::int64_t said, std::int64_t length);
    void findLikelyPackets();

    std::shared_ptr<OpenFile> m_file;
    std::vector<platform::AssetTrack> m_tracks;
    base::MediaTime m_duration;
    std::optional<base::MediaTime> m_durationBeforeCut;
    std::optional<VideoTrack> m_video;
    std::vector<int> m_audioStreams;
    std::vector<std::string> m_otherTracks;
    std::int64_t m_origin = 0;
    Owned<AVDictionary> m_metadata;
    std::int64_t m_likelyPackets = 0;
    FrameRef m_firstFrame;

    mutable std::mutex m_mutex;
    mutable std::unique_ptr<Demuxer> m_spare;
    mutable std::mutex m_tableMutex;
    mutable std::optional<bool> m_hasTable;
    mutable std::mutex m_indexMutex;
    mutable std::shared_ptr<const PacketIndex> m_index;
};

} // namespace ffmpeg
