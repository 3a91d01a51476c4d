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

class Asset;

/// Each sound track of `asset`, once it is loaded, in its order. Main queue only.
AudioMix audioMixOfAllTracks(const Asset& asset);

} // namespace platform
