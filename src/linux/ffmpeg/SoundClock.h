/// The time of a run of playing by what its device says was heard; by the system's clock while the device stands still for
/// too long. One thread.
#pragma once

#include "base/Affinity.h"
#include "base/Clock.h"
#include "linux/ffmpeg/AudioOutput.h"

#include <algorithm>
#include <chrono>
#include <cstdint>

namespace ffmpeg {

class SoundClock {
public:
    /// A device that wakes up, or is out of reach for a moment, may stand still for so long: picture and sound wait for
    /// each other. Then pictures go on in silence.
    static constexpr base::Instant kPatience = std::chrono::seconds(1);

    /// The run stands at `frames` now. It waits for the device, or already goes on without it.
    void start(std::int64_t frames, base::Instant now, bool isOnItsOwn)
    {
        m_affinity.assertHere();
        m_frames = m_ownFrames = frames;
        m_device = 0;
        m_movedAt = m_ownAt = now;
        m_isOnItsOwn = isOnItsOwn;
    }

    /// Where the run is; never before where it was. `device` is what was heard of it, as the device says.
    std::int64_t frames(std::int64_t device, base::Instant now)
    {
        m_affinity.assertHere();
        if (device > m_device) {
            m_device = device;
            m_movedAt = now;
            m_isOnItsOwn = false;
            m_frames = std::max(m_frames, device);
        } else if (!m_isOnItsOwn && now - m_movedAt > kPatience) {
            m_isOnItsOwn = true;
            m_ownAt = m_movedAt + kPatience;
            m_ownFrames = m_frames;
        }
        if (m_isOnItsOwn) {
            const std::chrono::duration<double> gone = now - m_ownAt;
            m_frames = std::max(m_frames, m_ownFrames + static_cast<std::int64_t>(gone.count() * kSampleRate));
        }
        return m_frames;
    }

    bool isOnItsOwn() const
    {
        m_affinity.assertHere();
        return m_isOnItsOwn;
    }

private:
    base::Affinity m_affinity;
    std::int64_t m_frames = 0;
    std::int64_t m_device = 0;
    base::Instant m_movedAt{0};
    bool m_isOnItsOwn = false;
    std::int64_t m_ownFrames = 0;
    base::Instant m_ownAt{0};
};

} // namespace ffmpeg
