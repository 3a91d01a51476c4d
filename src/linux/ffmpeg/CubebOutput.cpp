#include "linux/ffmpeg/CubebOutput.h"

#include <cubeb/cubeb.h>

#include <algorithm>
#include <chrono>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

namespace ffmpeg {

namespace {

using SteadyClock = std::chrono::steady_clock;

/// Silence that a device is given first: servers and amplifiers swallow the first 10 to 20 ms of what they begin with.
constexpr std::int64_t kLeadIn = kSampleRate / 25;
/// Between two places that a device tells; longer ones are those of a device that stands still.
constexpr std::int64_t kLongestStep = kSampleRate / 40;
/// A device that asks for samples, and has not told where it is for so long, never will.
constexpr std::chrono::milliseconds kLongestSilence{500};

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
        const auto now = SteadyClock::now();
        const std::lock_guard lock(m_mutex);
        const auto framesFrom = [&](SteadyClock::time_point from) {
            return static_cast<std::int64_t>(std::chrono::duration<double>(now - from).count() * kSampleRate);
        };
        if (m_failedAt)
            // A device that has died is not waited for: pictures go on in silence.
            return m_heard = std::max(m_heard, m_heardAtFailure + framesFrom(*m_failedAt));
        if (isKnown && static_cast<std::int64_t>(place) > m_place) {
            m_place = static_cast<std::int64_t>(place);
            m_placedAt = now;
        }
        std::int64_t heard = m_place;
        if (m_place > 0)
            heard += std::min(framesFrom(m_placedAt), kLongestStep); // some tell it in steps
        else if (m_askedAt && now - *m_askedAt > kLongestSilence)
            heard = m_before + framesFrom(m_latestAt) - kFramesAhead; // it never tells
        m_heard = std::max(m_heard, std::min(heard, m_given) - kLeadIn);
        return m_heard;
    }

private:
    static long dataWanted(cubeb_stream*, void* self, const void*, void* output, long frames)
    {
        auto& me = *static_cast<CubebOutput*>(self);
        auto* samples = static_cast<float*>(output);
        // Only this thread changes what was given.
        const std::int64_t silent = std::clamp<std::int64_t>(kLeadIn - me.m_given, 0, frames);
        std::fill_n(samples, 2 * silent, 0.0f);
        me.m_fill(samples + 2 * silent, static_cast<std::size_t>(frames - silent));
        const std::lock_guard lock(me.m_mutex);
        me.m_latestAt = SteadyClock::now();
        me.m_askedAt = me.m_askedAt.value_or(me.m_latestAt);
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
        me.m_heardAtFailure = me.m_heard;
        me.m_failedAt = me.m_failedAt.value_or(SteadyClock::now());
    }

    std::shared_ptr<Context> m_context;
    Fill m_fill;
    cubeb_stream* m_stream = nullptr;

    mutable std::mutex m_mutex;
    std::optional<SteadyClock::time_point> m_askedAt; ///< first
    SteadyClock::time_point m_latestAt{};             ///< that it asked
    std::int64_t m_before = 0;                        ///< given before that
    std::int64_t m_given = 0;
    mutable std::int64_t m_place = 0; ///< where the device says it is; 0 until it does
    mutable SteadyClock::time_point m_placedAt{};
    std::optional<SteadyClock::time_point> m_failedAt;
    std::int64_t m_heardAtFailure = 0;
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
