#include "linux/ffmpeg/exporting/sound/Placement.h"

#include <algorithm>
#include <cmath>

namespace ffmpeg {

namespace {

constexpr double kJitter = 0.020; ///< seconds; what a busy recorder's clock is off by
constexpr double kDrift = 0.004;  ///< seconds; more than that on the average is put right
constexpr double kAverage = 1.0 / 64;

} // namespace

Placement::Placement(AVRational timeBase, std::int64_t origin, int rate, Manner manner)
    : m_samplesPerTick(av_q2d(timeBase) * rate), m_origin(static_cast<double>(origin) * rate / AV_TIME_BASE)
{
    const double rounding = std::max(m_samplesPerTick * 1.01, 2.0);
    m_tolerance = manner == Manner::Copying ? rounding : std::max(rounding, kJitter * rate);
    m_longest = manner == Manner::Copying ? m_tolerance : std::max(rounding, kDrift * rate);
}

double Placement::said(std::int64_t pts) const
{
    m_affinity.assertHere();
    return static_cast<double>(pts) * m_samplesPerTick - m_origin;
}

void Placement::begin(const std::vector<Piece>& pieces)
{
    m_affinity.assertHere();
    m_hasBegun = true;
    m_drift = 0;
    if (pieces.empty())
        return;
    const double first = said(pieces.front().pts);
    double earliest = first - m_samplesPerTick / 2;
    double latest = first + m_samplesPerTick / 2;
    double sum = 0;
    double count = 0;
    std::int64_t behind = 0;
    for (const Piece& piece : pieces) {
        const double start = said(piece.pts) - static_cast<double>(behind);
        if (std::abs(start - first) > m_tolerance)
            break;
        earliest = std::max(earliest, start - m_samplesPerTick / 2);
        latest = std::min(latest, start + m_samplesPerTick / 2);
        sum += start;
        ++count;
        behind += piece.samples;
    }
    // Ticks that are about as fine as samples need no guess; times that agree on a moment name it; others their mean.
    double start = first;
    if (m_samplesPerTick > 1.5)
        start = earliest <= latest ? (earliest + latest) / 2 : sum / count;
    m_next = std::llround(start);
}

std::int64_t Placement::place(const Piece& piece)
{
    m_affinity.assertHere();
    if (!m_hasBegun)
        begin({piece});
    const double off = said(piece.pts) - static_cast<double>(m_next);
    m_drift += (off - m_drift) * kAverage;
    if (std::abs(off) > m_tolerance) {
        m_next = std::llround(said(piece.pts));
        m_drift = 0;
    } else if (std::abs(m_drift) > m_longest) {
        m_next += std::llround(m_drift);
        m_drift = 0;
    }
    const std::int64_t at = m_next;
    m_next += piece.samples;
    return at;
}

} // namespace ffmpeg
