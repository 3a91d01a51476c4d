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
    /// How many pairs were heard since this was made, by where the device says that it is now; never fewer than before.
    /// It stands still where the device does. Any thread.
    virtual std::int64_t framesHeard() const = 0;
};

/// Samples a second of all sound that is played.
inline constexpr int kSampleRate = 48000;

/// What a device keeps of samples, so that none are missed where its thread or the server come late on a busy machine: at
/// most 0.2 s, never less than half of that.
inline constexpr int kFramesAhead = kSampleRate / 5;

/// Makes a device that runs at once; null where there is none. Called on a worker, and may take its time.
using MakeAudioOutput = std::function<std::unique_ptr<AudioOutput>(AudioOutput::Fill)>;

} // namespace ffmpeg
