/// How an export mixes the sound: one input for each track that is heard. A value; any thread.
#pragma once

#include <vector>

namespace platform {

/// One track of the mix, at unity gain.
struct AudioMixInput {
    int trackID = 0; ///< of an AssetTrack

    friend bool operator==(const AudioMixInput&, const AudioMixInput&) = default;
};

struct AudioMix {
    std::vector<AudioMixInput> inputs;

    friend bool operator==(const AudioMix&, const AudioMix&) = default;
};

} // namespace platform
