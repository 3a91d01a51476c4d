/// A fixture that exports movies into a directory of its own.
#pragma once

#include "linux/ffmpeg/exporting/DecodedMovie.h"
#include "linux/ffmpeg/exporting/ExportJob.h"
#include "platform/media/ExportSession.h"
#include "support/EngineTest.h"
#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"

#include <filesystem>
#include <fstream>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tests {

class ExportTest : public EngineTest {
protected:
    using ExportStatus = platform::ExportSession::Status;
    using Range = base::MediaTimeRange;

    std::string directory() const { return m_directory.path().string(); }
    static std::string exportMovie(const std::string& name) { return movie("export/" + name); }
    std::string output(const std::string& name = "out.mp4") const { return directory() + "/" + name; }
    static Range fromTo(double start, double end) { return {at(start), at(end - start)}; }

    std::shared_ptr<platform::ExportSession> sessionFor(const std::string& from, const std::string& to,
                                                        std::optional<Range> range)
    {
        asset = media.assetWithURL(base::Url::fromPath(from));
        auto session = media.exportSessionWithAsset(asset, platform::ExportPreset::HighestQuality);
        session->setOutputURL(base::Url::fromPath(to));
        session->setOutputFileType(platform::FileType::Mpeg4);
        session->setTimeRange(range);
        return session;
    }
    /// Runs it to its end; gives the final status.
    ExportStatus run(const std::shared_ptr<platform::ExportSession>& session)
    {
        std::atomic<int> ended = 0;
        session->exportAsynchronously([&] { ++ended; });
        EXPECT_TRUE(waitFor([&] { return ended > 0; }));
        EXPECT_EQ(ended, 1);
        m_lastError = session->error();
        return session->status();
    }
    ExportStatus cut(const std::string& from, const std::string& to, std::optional<Range> range)
    {
        return run(sessionFor(from, to, range));
    }
    /// The work without the session, on this thread.
    base::Result<void> runJob(const std::string& from, std::optional<Range> range) { return jobOf(from, range).run(); }
    base::Result<void> runJobRefusing(const std::vector<RefusedSystemCall>& calls, const std::string& from,
                                      std::optional<Range> range)
    {
        const ffmpeg::ExportJob job = jobOf(from, range);
        base::Result<void> result;
        whileRefusing(calls, [&] { result = job.run(); });
        return result;
    }
    /// Opens the movie here; the job can be run on any thread.
    ffmpeg::ExportJob jobOf(const std::string& from, std::optional<Range> range)
    {
        EXPECT_EQ(open(from), Status::ReadyToPlay);
        ffmpeg::ExportJob job;
        job.movie = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
        job.output = output();
        job.range = range;
        job.cancelled = std::make_shared<std::atomic<bool>>(false);
        job.log = &log;
        return job;
    }
    static std::string bytesOf(const std::string& path)
    {
        std::ifstream file(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }
    std::string errorText() const { return m_lastError ? m_lastError->description() : ""; }
    /// Names of what lies in the directory.
    std::vector<std::string> files() const { return namesIn(directory()); }
    bool saysEncodedAsAWhole() const
    {
        for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
            if (line.find("is encoded as a whole") != std::string::npos)
                return true;
        return false;
    }

private:
    PrivateDirectory m_directory;
    base::ErrorRef m_lastError;
};

} // namespace tests
