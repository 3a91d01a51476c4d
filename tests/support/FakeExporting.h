/// Export sessions and image generators in memory: they remember what they were asked, and end when a test says so.
#pragma once

#include "platform/media/Asset.h"
#include "platform/media/ExportSession.h"
#include "platform/media/ImageGenerator.h"
#include "support/CallListener.h"

#include <memory>
#include <optional>
#include <utility>
#include <vector>

namespace tests {

class FakeExportSession final : public platform::ExportSession {
public:
    explicit FakeExportSession(std::shared_ptr<platform::Asset> theAsset,
                               CallListenerRef listener = std::make_shared<CallListener>())
        : asset(std::move(theAsset)), m_listener(std::move(listener))
    {
    }

    // As with a real one, what is set after the start comes too late.
    void setOutputURL(std::optional<base::Url> url) override { set(m_outputURL, std::move(url)); }
    void setOutputFileType(platform::FileType type) override { set(fileType, type); }
    void setTimeRange(std::optional<base::MediaTimeRange> range) override { set(timeRange, range); }
    void setAudioMix(std::optional<platform::AudioMix> mix) override { set(audioMix, std::move(mix)); }
    void exportAsynchronously(std::function<void()> done) override
    {
        (*m_listener)("export");
        m_status = Status::Waiting; // as a real one does until its asset is loaded
        m_done = std::move(done);
    }
    void cancelExport() override { wasCancelled = true; }
    Status status() const override { return m_status; }
    base::ErrorRef error() const override { return m_error; }
    std::optional<base::Url> outputURL() const override { return m_outputURL; }
    double progress() const override { return m_status == Status::Completed ? 1 : 0; }

    bool isRunning() const { return m_done != nullptr; }
    /// Ends the export, and tells so at once on the caller's thread.
    void finish(Status status, base::ErrorRef why = nullptr)
    {
        const auto keepAlive = shared_from_this();
        m_status = status;
        m_error = std::move(why);
        if (const auto done = std::exchange(m_done, nullptr))
            done();
    }

    const std::shared_ptr<platform::Asset> asset;
    std::optional<platform::FileType> fileType;
    std::optional<base::MediaTimeRange> timeRange;
    std::optional<platform::AudioMix> audioMix;
    bool wasCancelled = false;

private:
    template <typename T, typename Value> void set(std::optional<T>& place, Value&& value) const
    {
        if (m_status == Status::Unknown)
            place = std::forward<Value>(value);
    }

    CallListenerRef m_listener;
    std::optional<base::Url> m_outputURL;
    Status m_status = Status::Unknown;
    base::ErrorRef m_error;
    std::function<void()> m_done;
};

class FakeImageGenerator final : public platform::ImageGenerator {
public:
    struct Request {
        base::MediaTime time;
        Handler handler;
    };

    explicit FakeImageGenerator(std::shared_ptr<platform::Asset> theAsset,
                                CallListenerRef listener = std::make_shared<CallListener>())
        : asset(std::move(theAsset)), m_listener(std::move(listener))
    {
    }
    ~FakeImageGenerator() override { (*m_listener)("generator dropped"); }

    void setMaximumSize(base::Size size) override { m_maximumSize = size; }
    base::Size maximumSize() const override { return m_maximumSize; }
    void generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times, Handler handler) override
    {
        for (const base::MediaTime& time : times)
            requests.push_back({time, handler});
    }

    /// Answers the request at `index`, on the caller's thread.
    void succeed(std::size_t index, const platform::ImageRef& image) const
    {
        const Request request = requests.at(index);
        request.handler(request.time, image, request.time, Result::Succeeded, nullptr);
    }
    void fail(std::size_t index, const base::ErrorRef& why = base::Error::make("fake", -1, "No picture.")) const
    {
        const Request request = requests.at(index);
        request.handler(request.time, nullptr, base::MediaTime::invalid(), Result::Failed, why);
    }

    const std::shared_ptr<platform::Asset> asset;
    std::vector<Request> requests; ///< all that came, answered or not

private:
    CallListenerRef m_listener;
    base::Size m_maximumSize;
};

} // namespace tests
