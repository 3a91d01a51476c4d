#include "linux/ffmpeg/CubebOutput.h"

#include "linux/ffmpeg/DevicePlace.h"

#include <cubeb/cubeb.h>

#include <algorithm>
#include <chrono>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

namespace ffmpeg {

namespace {

base::Instant now()
{
    return base::SystemClock().now();
}

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
        if (cubeb_stream_init(m_context->handle, &m_stream, "Clipsa", nullptr, nullptr, nullptr, &wanted, kFramesAhead,
                              dataWanted, stateChanged, this)
            != CUBEB_OK) {
            m_stream = nullptr;
            return false;
        }
        return cubeb_stream_start(m_stream) == CUBEB_OK;
    }

    std::int64_t framesHeard() const override
    {
        std::uint64_t place = 0;
        // Without the lock: the device has one of its own, and holds it while it wants data.
        const bool isKnown = cubeb_stream_get_position(m_stream, &place) == CUBEB_OK;
        const std::lock_guard lock(m_mutex);
        return m_place.heard(isKnown ? std::optional(static_cast<std::int64_t>(place)) : std::nullopt, now());
    }

private:
    static long dataWanted(cubeb_stream*, void* self, const void*, void* output, long frames)
    {
        auto& me = *static_cast<CubebOutput*>(self);
        auto* samples = static_cast<float*>(output);
        // Only this thread changes what was given.
        const std::int64_t silent = std::clamp<std::int64_t>(DevicePlace::kLeadIn - me.m_place.given(), 0, frames);
        std::fill_n(samples, 2 * silent, 0.0f);
        me.m_fill(samples + 2 * silent, static_cast<std::size_t>(frames - silent));
        const std::lock_guard lock(me.m_mutex);
        me.m_place.give(frames, now());
        return frames;
    }
    static void stateChanged(cubeb_stream*, void* self, cubeb_state state)
    {
        if (state != CUBEB_STATE_ERROR)
            return;
        auto& me = *static_cast<CubebOutput*>(self);
        const std::lock_guard lock(me.m_mutex);
        me.m_place.fail(now());
    }

    std::shared_ptr<Context> m_context;
    Fill m_fill;
    cubeb_stream* m_stream = nullptr;

    mutable std::mutex m_mutex;
    mutable DevicePlace m_place;
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
