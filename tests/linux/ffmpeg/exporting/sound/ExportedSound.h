/// Exports the sound of a movie without its pictures.
#pragma once

#include "linux/ffmpeg/exporting/sound/SoundSources.h"

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace tests {

struct ExportedSound {
    std::vector<std::string> log;
    std::size_t tracks = 0;
    std::string error;
};

/// Writes the sound of a range (seconds; the whole movie when `to` is negative) as MP4.
ExportedSound exportSound(const std::string& from, const std::string& into, double start, double to,
                          const std::optional<platform::AudioMix>& mix = std::nullopt);
/// A mix of all sound tracks of a file.
platform::AudioMix mixOfAll(const std::string& path);

} // namespace tests
