#include "app/host/MixMovie.h"

#include "app/host/ExportMovie.h"

namespace host {

int mixMovie(const MixCommand& command)
{
    const auto setUp = [](platform::ExportSession& session, const platform::Asset& asset) {
        platform::AudioMix mix;
        for (const platform::AssetTrack& track : asset.tracksWithMediaType(platform::MediaType::Audio))
            mix.inputs.push_back({track.trackID});
        session.setAudioMix(mix);
    };
    return exportMovie({"Mixing", command.movie, command.output, command.force, setUp});
}

} // namespace host
