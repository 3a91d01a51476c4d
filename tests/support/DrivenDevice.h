/// A sound device that plays when the test says so.
#pragma once

#include "linux/ffmpeg/AudioOutput.h"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

namespace tests {

class DrivenDevice {
public:
    ffmpeg::MakeAudioOutput maker()
    {
        return [this](ffmpeg::AudioOutput::Fill fill) -> std::unique_ptr<ffmpeg::AudioOutput> {
            const std::lock_guard lock(m_mutex);
            ++made;
            if (isMissing)
                return nullptr;
            m_fill = std::move(fill);
            m_heard = 0;
            return std::make_unique<Output>(*this);
        };
    }
    /// What was heard: nothing when nobody plays.
    std::vector<float> play(std::size_t frames)
    {
        const std::lock_guard lock(m_mutex);
        std::vector<float> samples(frames * 2);
        if (!m_fill)
            return {};
        m_fill(samples.data(), frames);
        m_heard += static_cast<std::int64_t>(frames);
        return samples;
    }
    bool isPlaying() const
    {
        const std::lock_guard lock(m_mutex);
        return m_fill != nullptr;
    }

    std::atomic<int> made = 0;
    std::atomic<bool> isMissing = false;

private:
    struct Output final : ffmpeg::AudioOutput {
        explicit Output(DrivenDevice& theDevice) : device(theDevice) {}
        ~Output() override
        {
            const std::lock_guard lock(device.m_mutex);
            device.m_fill = nullptr;
        }
        std::int64_t framesHeard() const override { return device.m_heard; }
        DrivenDevice& device;
    };

    mutable std::mutex m_mutex;
    ffmpeg::AudioOutput::Fill m_fill;
    std::atomic<std::int64_t> m_heard = 0;
};

} // namespace tests
