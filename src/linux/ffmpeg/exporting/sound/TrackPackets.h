/// Reads the packets of one sound track, as MP4 wants them, with a demuxer of its own. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/Movie.h"

extern "C" {
#include <libavcodec/bsf.h>
}

#include <memory>
#include <vector>

namespace ffmpeg {

struct FreeingFilter {
    void operator()(AVBSFContext* filter) const { av_bsf_free(&filter); }
};
struct FreeingParameters {
    void operator()(AVCodecParameters* parameters) const { avcodec_parameters_free(&parameters); }
};

class TrackPackets {
public:
    static base::Result<std::unique_ptr<TrackPackets>> open(std::shared_ptr<const Movie> movie, int stream,
                                                            const Cancelled& cancelled);

    const Movie& movie() const
    {
        m_affinity.assertHere();
        return *m_movie;
    }
    AVStream& stream() const
    {
        m_affinity.assertHere();
        return m_demuxer->stream(m_stream);
    }
    /// With the header that decoders and MP4 need, and the rate and channels that are heard.
    const AVCodecParameters& parameters() const
    {
        m_affinity.assertHere();
        return *m_parameters;
    }
    int rate() const
    {
        m_affinity.assertHere();
        return m_parameters->sample_rate;
    }
    /// What each packet of AAC holds, at that rate; 0 when it is not known, or of other codecs.
    int samplesOfAac() const
    {
        m_affinity.assertHere();
        return m_samplesOfAac;
    }
    /// Whether a packet that was read was so damaged that it was left out.
    bool isDamaged() const
    {
        m_affinity.assertHere();
        return m_isDamaged;
    }

    /// The next packet is one that begins at or before this moment of the movie, or the track's first.
    void seek(double seconds);
    /// Whether what is read next, or was read since, begins with the track's first packet.
    bool isFromStart() const
    {
        m_affinity.assertHere();
        return m_isFromStart;
    }
    /// 0, AVERROR_EOF where the track ends or the file is cut, AVERROR_EXIT, or another error after which nothing can
    /// be read. Every packet has a presentation time, and one whose length cannot be told otherwise a duration.
    int read(AVPacket& packet);
    /// What its owner calls last before another thread goes on with it.
    void detach();

private:
    TrackPackets(std::shared_ptr<const Movie> movie, std::unique_ptr<Demuxer> demuxer, int stream);

    int prepare();
    int readFirst(std::vector<Owned<AVPacket>>& packets, int count);
    int findAacHeader();
    int openFilter();
    int hearAac();
    bool trySeek(double seconds);
    void toStart();
    int readFiltered(AVPacket& packet);
    int readTimed(AVPacket& packet);

    base::Affinity m_affinity;
    std::shared_ptr<const Movie> m_movie;
    std::unique_ptr<Demuxer> m_demuxer;
    int m_stream;
    std::unique_ptr<AVCodecParameters, FreeingParameters> m_parameters;
    std::unique_ptr<AVBSFContext, FreeingFilter> m_filter;
    Owned<AVPacket> m_ahead; ///< read already
    int m_samplesOfAac = 0;
    std::int64_t m_expected = AV_NOPTS_VALUE;
    std::int64_t m_duration = 0; ///< of the packet before
    bool m_isDamaged = false;
    bool m_isFromStart = false;
};

} // namespace ffmpeg
