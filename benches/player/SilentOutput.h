/// A sound device that asks for samples at the right pace and lets nobody hear them, as mpv's --ao=null does.
#pragma once

#include "linux/ffmpeg/AudioOutput.h"

#include <atomic>
#include <chrono>
#include <thread>
#include <vector>

namespace bench {

class SilentOutput final : public ffmpeg::AudioOutput {
public:
    explicit SilentOutput(Fill fill);
    ~SilentOutput() override;

    std::int64_t framesHeard() const override;

private:
    static constexpr int kPart = ffmpeg::kSampleRate / 50; ///< frames that are asked for at once: 20 ms

    void loop();

    Fill m_fill;
    const std::chrono::steady_clock::time_point m_start = std::chrono::steady_clock::now();
    std::atomic<std::int64_t> m_given{0};
    std::atomic<bool> m_ending{false};
    std::thread m_thread;
};

} // namespace bench
