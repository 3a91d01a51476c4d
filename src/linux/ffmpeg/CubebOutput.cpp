#include "linux/ffmpeg/CubebOutput.h"

#include <cubeb/cubeb.h>

#include <algorithm>
#include <chrono>
#include <mutex>
#include <string>
#include <utility>

namespace ffmpeg {

namespace {

using SteadyClock = std::chrono::steady_clock;

constexpr std::uint32_t kLatency = kSampleRate / 25; ///< frames: 40 ms, which no desktop server refuses

struct Context {
    cubeb* handle = nullptr;
    bool tried = false;
    bool logged = false;
    std::mutex mutex; ///< players start devices on threads of their own

    ~Context()
    {
        if (handle)
            cubeb_destroy(handle);
    }
};

class CubebOutput final : public AudioOutput {
public:
    CubebOutput(std::shared_ptr<Context> context, Fill fill) : m_context(std::move(context)), m_fill(std::move(fill)) {}
    ~CubebOutput() override
    {
        if (m_stream) {
            cubeb_stream_stop(m_stream);
            cubeb_stream_destroy(m_stream);
        }
    }

    bool start()
    {
        cubeb_stream_params wanted{};
        wanted.format = CUBEB_SAMPLE_FLOAT32NE;
        wanted.rate = kSampleRate;
        wanted.channels = 2;
        wanted.layout = CUBEB_LAYOUT_STEREO;
        if (cubeb_stream_init(m_context->handle, &m_stream, "Clipsa", nullptr, nullptr, nullptr, &wanted, kLatency,
                              dataWanted, stateChanged, this)
            != CUBEB_OK) {
            m_stream = nullptr;
            return false;
        }
        if (cubeb_stream_start(m_stream) != CUBEB_OK)
            return false;
        std::uint32_t latency = 0;
        cubeb_stream_get_latency(m_stream, &latency);
        const std::lock_guard lock(m_mutex);
        m_latency = std::clamp(latency, kLatency, static_cast<std::uint32_t>(kSampleRate));
        return true;
    }

    std::int64_t framesHeard() const override
    {
        const std::lock_guard lock(m_mutex);
        if (m_askedAt == SteadyClock::time_point{})
            return m_heard;
        const std::chrono::duration<double> elapsed = SteadyClock::now() - m_askedAt;
        std::int64_t heard = m_before + static_cast<std::int64_t>(elapsed.count() * kSampleRate) - m_latency;
        // A device that has died is not waited for: pictures go on in silence.
        if (!m_failed)
            heard = std::min(heard, m_given);
        m_heard = std::max(m_heard, heard);
        return m_heard;
    }

private:
    static long dataWanted(cubeb_stream*, void* self, const void*, void* output, long frames)
    {
        auto& me = *static_cast<CubebOutput*>(self);
        me.m_fill(static_cast<float*>(output), static_cast<std::size_t>(frames));
        const std::lock_guard lock(me.m_mutex);
        me.m_askedAt = SteadyClock::now();
        me.m_before = me.m_given;
        me.m_given += frames;
        return frames;
    }
    static void stateChanged(cubeb_stream*, void* self, cubeb_state state)
    {
        if (state != CUBEB_STATE_ERROR)
            return;
        auto& me = *static_cast<CubebOutput*>(self);
        const std::lock_guard lock(me.m_mutex);
        me.m_failed = true;
        if (me.m_askedAt == SteadyClock::time_point{})
            me.m_askedAt = SteadyClock::now();
    }

    std::shared_ptr<Context> m_context;
    Fill m_fill;
    cubeb_stream* m_stream = nullptr;

    mutable std::mutex m_mutex;
    SteadyClock::time_point m_askedAt{};
    std::int64_t m_before = 0; ///< given before the latest call for data
    std::int64_t m_given = 0;
    std::int64_t m_latency = kLatency;
    bool m_failed = false;
    mutable std::int64_t m_heard = 0;
};

} // namespace

MakeAudioOutput cubebOutput(base::Log& log)
{
    return [context = std::make_shared<Context>(), &log](AudioOutput::Fill fill) -> std::unique_ptr<AudioOutput> {
        const std::lock_guard lock(context->mutex);
        if (!std::exchange(context->tried, true) && cubeb_init(&context->handle, "Clipsa", nullptr) != CUBEB_OK)
            context->handle = nullptr;
        auto output = std::make_unique<CubebOutput>(context, std::move(fill));
        if (context->handle && output->start())
            return output;
        if (!std::exchange(context->logged, true))
            log.message("There is no sound device; movies are played in silence.");
        return nullptr;
    };
}

} // namespace ffmpeg
