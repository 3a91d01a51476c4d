/// What a movie is made of, in values of no library. Made on a worker, because it can read the whole file; immutable.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/Movie.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace ffmpeg {

struct PictureFacts {
    std::string codec;                       ///< "h264"
    std::string profile;                     ///< "High"; empty when unknown
    std::string format;                      ///< of the pixels: "yuv420p"
    int width = 0, height = 0;               ///< pixels as they are coded
    int displayWidth = 0, displayHeight = 0; ///< upright, in square pixels
    int rotation = 0;                        ///< degrees clockwise that make it upright: 0, 90, 180 or 270
    std::int64_t count = 0;                  ///< of pictures that are shown
    double rate = 0;                         ///< pictures a second, on average; 0 when there is only one
    double shortest = 0, longest = 0;        ///< seconds that a picture stands, but for the last
    bool isVariable = false;                 ///< these two differ by more than rounding
    std::int64_t keyframes = 0;
    /// Seconds between two keyframes; 0 when there is only one.
    double shortestGroup = 0, medianGroup = 0, longestGroup = 0;
    std::int64_t bitRate = 0; ///< bits a second
};

struct SoundFacts {
    std::string codec;
    std::string title;    ///< empty when it has none
    std::string language; ///< as the file says; empty when it does not
    std::string layout;   ///< "stereo"
    int rate = 0;         ///< samples a second
    int channels = 0;
    std::int64_t bitRate = 0; ///< bits a second; 0 when unknown
    bool isHeard = true;      ///< there is a decoder
};

struct OtherFacts {
    std::string kind; ///< "subtitle", "data", "attachment", "video" for pictures behind the first track's
    std::string codec;
};

struct MovieFacts {
    std::string container;        ///< "MP4", "Matroska / WebM"
    double duration = 0;          ///< seconds
    bool isCutOff = false;        ///< its file lacks the rest
    double durationBeforeCut = 0; ///< seconds that its header then tells of; 0 when unknown
    std::int64_t bytes = 0;
    std::int64_t bitRate = 0;            ///< of all, bits a second
    std::optional<PictureFacts> picture; ///< of the track that is shown
    std::vector<SoundFacts> sounds;      ///< in the file's order
    std::vector<OtherFacts> others;

    static base::Result<MovieFacts> of(const Movie& movie, const Cancelled& cancelled);
};

} // namespace ffmpeg
