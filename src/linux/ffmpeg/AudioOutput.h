/// Where sound goes: a device that asks for samples and tells how many were heard.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>

namespace ffmpeg {

class AudioOutput {
public:
    /// Fills `frames` pairs of samples, left and right, between -1 and 1. Called on the device's thread: never waits.
    using Fill = std::function<void(float* samples, std::size_t frames)>;

    /// Stops; `Fill` is not called any more when it returns.
    virtual ~AudioOutput() = default;
    /// How many pairs were heard since this was made; never fewer than before. Any thread.
    virtual std::int64_t framesHeard() const = 0;
};

/// Samples a second of all sound that is played.
inline constexpr int kSampleRate = 48000;

/// Makes a device that runs at once; null where there is none. Called on a worker, and may take its time.
using MakeAudioOutput = std::function<std::unique_ptr<AudioOutput>(AudioOutput::Fill)>;

} // namespace ffmpeg
