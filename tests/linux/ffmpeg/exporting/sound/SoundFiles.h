/// Makes sound files out of formulas, exports sound without pictures, and decodes what came out.
#pragma once

#include "linux/ffmpeg/exporting/sound/DecodedSound.h"

#include "linux/ffmpeg/exporting/sound/SoundSources.h"

#include <cmath>
#include <cstdint>
#include <functional>
#include <numbers>
#include <string>
#include <vector>

namespace tests {

/// The sample of a channel at a moment in seconds.
using Signal = std::function<double(double seconds, int channel)>;

/// How the packets of AAC say that they hold twice the rate that they are coded at: not at all, in the header, or only in
/// the packets themselves. There is nothing in the upper half of the band that they add.
enum class DoubledRate { No, InHeader, InPackets };

struct SoundTrackSpec {
    std::string encoder = "aac";
    int rate = 48000; ///< that the packets are coded at
    DoubledRate doubled = DoubledRate::No;
    int channels = 2;
    std::int64_t bitRate = 0; ///< what the encoder takes by itself when 0
    Signal signal;
    double seconds = 6;
    double start = 0;
    std::string language = "";
    std::string handler = "";
    bool isDefault = true;
};

/// Writes a file with these sound tracks; the container by the name's ending, as fragments when the name says so.
void makeSoundFile(const std::string& path, const std::vector<SoundTrackSpec>& tracks);

/// Everywhere in a file.
void replaceIn(const std::string& path, const std::string& what, const std::string& with);
/// Takes the headers of all tracks of AAC out of an MP4 file.
void removeAacHeaders(const std::string& path);
/// Overwrites all that lies in an MP4 file's packets.
void damagePackets(const std::string& path);

/// A file of plain AAC whose windows are the other kind than our encoder makes: as many others' encoders choose them.
void makeSineWindowedFile(const std::string& path, const SoundTrackSpec& track);

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

/// How loud a tone is in a part of a channel, as the peak of a sine.
inline double toneIn(const std::vector<float>& samples, int rate, double frequency, std::size_t from, std::size_t until)
{
    double sine = 0;
    double cosine = 0;
    until = std::min(until, samples.size());
    for (std::size_t i = from; i < until; ++i) {
        const double angle = 2 * std::numbers::pi * frequency * static_cast<double>(i) / rate;
        sine += static_cast<double>(samples[i]) * std::sin(angle);
        cosine += static_cast<double>(samples[i]) * std::cos(angle);
    }
    return until > from ? 2 * std::hypot(sine, cosine) / static_cast<double>(until - from) : 0;
}

inline Signal tone(double frequency, double level)
{
    return [=](double seconds, int) { return level * std::sin(2 * std::numbers::pi * frequency * seconds); };
}

/// Sound that is nowhere like itself a little later: what is out of place by a sample is seen.
Signal speechLike(double level);
/// The same without anything that would make an encoder change its windows.
Signal humming(double level);

} // namespace tests
