/// A sound track whose packets are copied; those at the edges of a cut are encoded again. One thread.
#pragma once

#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/sound/AacJoint.h"
#include "linux/ffmpeg/exporting/sound/Placement.h"
#include "linux/ffmpeg/exporting/sound/TrackPackets.h"

#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace ffmpeg {

class CopiedTrack final : public TrackSource {
public:
    /// Why a track cannot be copied, for the log; empty where there is no sound in the range at all.
    struct Refusal {
        std::string reason;
        int error = 0; ///< negative when reading was cancelled
    };

    static std::variant<std::unique_ptr<CopiedTrack>, Refusal> open(std::unique_ptr<TrackPackets> packets,
                                                                    const ExportRange& range);

    base::Result<void> describe(AVStream& output) override;
    base::Result<bool> next(AVPacket& packet) override;
    void detach() override;

private:
    CopiedTrack(std::unique_ptr<TrackPackets> packets, const ExportRange& range);

    int readAround(std::int64_t sample, double before, std::int64_t behind, std::vector<AacPiece>& pieces,
                   bool& isFromStart, bool& isToEnd);
    std::optional<Refusal> prepareEnd();
    std::optional<Refusal> prepareStart();
    std::int64_t samplesIn(const AVPacket& packet) const;
    std::int64_t lengthOf(const AVPacket& packet) const;
    bool isAac() const { return m_packets->parameters().codec_id == AV_CODEC_ID_AAC; }
    void give(AVPacket& packet, std::int64_t at, std::int64_t samples);

    std::unique_ptr<TrackPackets> m_packets;
    std::int64_t m_from, m_until; ///< the range, in samples of the movie
    bool m_endsWithMovie;
    bool m_isCuttable;
    std::unique_ptr<Placement> m_placement;
    std::deque<Owned<AVPacket>> m_first; ///< encoded, from m_firstAt on
    std::int64_t m_firstAt = 0;
    std::deque<AacPiece> m_read;        ///< copied, read already
    std::optional<std::int64_t> m_stop; ///< ticks: this packet and those behind are not copied
    std::deque<Owned<AVPacket>> m_last; ///< encoded, in their place
    std::int64_t m_next = INT64_MIN;    ///< right behind what was given
    bool m_hasEnded = false;
};

} // namespace ffmpeg
