/// The sound of an exported movie: which of its tracks are copied, which are encoded, and what is mixed.
#pragma once

#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/exporting/TrackSource.h"
#include "platform/media/AudioMix.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace ffmpeg {

/// Gets a line for the log: why a track could not be copied, or what could not be read.
using TellLog = std::function<void(const std::string&)>;

enum class SoundMode {
    Copy,  ///< encoded again only what the cuts break, and what cannot be copied
    Encode ///< all of it
};

/// The sound tracks of what is exported, each a source of its own that may be read in any order with the others.
///
/// Without a mix every track is kept: its packets are copied, those at the edges of the range are encoded again so that
/// nothing outside of it stays in the file; a track that cannot be cut like that is decoded and encoded as a whole.
/// With a mix there is one track, the sum of its inputs, or none where there is no input. A track that cannot be read
/// at all is left out and told about; that is no error. `log` is called on the threads of this and of the sources'
/// next(), never on others, and as long as the sources live.
base::Result<std::vector<std::unique_ptr<TrackSource>>> openSoundSources(std::shared_ptr<const Movie> movie,
                                                                         const ExportRange& range,
                                                                         const std::optional<platform::AudioMix>& mix,
                                                                         SoundMode mode, const Cancelled& cancelled,
                                                                         const TellLog& log);

} // namespace ffmpeg
