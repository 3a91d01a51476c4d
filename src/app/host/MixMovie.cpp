#include "app/host/MixMovie.h"

#include "app/host/ExportMovie.h"

namespace host {

int mixMovie(const MixCommand& command)
{
    const auto setUp = [](platform::ExportSession& session, const platform::Asset& asset) {
        session.setAudioMix(platform::audioMixOfAllTracks(asset));
    };
    return exportMovie({"Mixing", command.movie, command.output, command.force, setUp});
}

} // namespace host
