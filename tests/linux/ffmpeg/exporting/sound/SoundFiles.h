/// Makes sound files out of formulas, and damages them.
#pragma once

#include "linux/ffmpeg/exporting/sound/Signals.h"

#include <cstdint>
#include <string>
#include <vector>

namespace tests {

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

} // namespace tests
