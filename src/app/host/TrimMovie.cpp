#include "app/host/TrimMovie.h"

#include "app/host/ExportMovie.h"

namespace host {

int trimMovie(const TrimCommand& command)
{
    const auto setUp = [&](platform::ExportSession& session, const platform::Asset& /*asset*/) {
        const base::MediaTime length = command.to ? *command.to - command.from : base::MediaTime::positiveInfinity();
        session.setTimeRange(base::MediaTimeRange{command.from, length});
    };
    return exportMovie({"Trimming", command.movie, command.output, command.force, setUp});
}

} // namespace host
