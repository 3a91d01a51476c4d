/// The machine's sound device, through cubeb.
#pragma once

#include "base/Log.h"
#include "linux/ffmpeg/AudioOutput.h"

namespace ffmpeg {

/// Gives null where there is no device, which is logged once. `log` outlives it.
MakeAudioOutput cubebOutput(base::Log& log);

} // namespace ffmpeg
