/// How much of what a sound device was given was heard, by where the device says that it is. Whoever shares it between
/// threads locks it.
#pragma once

#include "base/Clock.h"
#include "linux/ffmpeg/AudioOutput.h"

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <optional>

namespace ffmpeg {

/// Frames are counted from the start, those of the lead-in too where nothing else is said.
class DevicePlace {
public:
    /// Silence that a device is given first: servers and amplifiers swallow the first 10 to 20 ms of what they begin with.
    static constexpr std::int64_t kLeadIn = kSampleRate / 25;

    std::int64_t given() const { return m_given; }
    void give(std::int64_t frames, base::Instant now)
    {
        m_latestAt = now;
        m_askedAt = m_askedAt.value_or(now);
        m_before = m_given;
        m_given += frames;
    }
    /// It has died, and is not waited for: pictures go on in silence. It may say so several times.
    void fail(base::Instant now)
    {
        if (m_failedAt)
            return;
        m_failedAt = now;
        m_heardAtFailure = m_heard;
    }
    /// Without the lead-in; never fewer than before. `told` is where the device says that it is, nothing when it does not.
    std::int64_t heard(std::optional<std::int64_t> told, base::Instant now)
    {
        if (m_failedAt)
            return m_heard = std::max(m_heard, m_heardAtFailure + framesIn(now - *m_failedAt));
        if (told && *told > m_place) {
            m_place = *told;
            m_placedAt = now;
        }
        std::int64_t heard = m_place;
        if (m_place > 0)
            heard += std::min(framesIn(now - m_placedAt), kLongestStep); // some tell it in steps
        else if (m_askedAt && now - *m_askedAt > kLongestSilence)
            heard = m_before + framesIn(now - m_latestAt) - kFramesAhead; // it never tells
        return m_heard = std::max(m_heard, std::min(heard, m_given) - kLeadIn);
    }

private:
    /// Between two places that a device tells; longer ones are those of a device that stands still.
    static constexpr std::int64_t kLongestStep = kSampleRate / 40;
    /// A device that asks for samples, and has not told where it is for so long, never will.
    static constexpr base::Instant kLongestSilence = std::chrono::milliseconds(500);

    static std::int64_t framesIn(base::Instant time)
    {
        return static_cast<std::int64_t>(std::chrono::duration<double>(time).count() * kSampleRate);
    }

    std::optional<base::Instant> m_askedAt; ///< first
    base::Instant m_latestAt{0};            ///< that it asked
    std::int64_t m_before = 0;              ///< given before that
    std::int64_t m_given = 0;
    std::int64_t m_place = 0; ///< the last that it told; 0 until it does
    base::Instant m_placedAt{0};
    std::optional<base::Instant> m_failedAt;
    std::int64_t m_heardAtFailure = 0;
    std::int64_t m_heard = 0;
};

} // namespace ffmpeg
