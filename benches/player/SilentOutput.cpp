#include "player/SilentOutput.h"

#include <algorithm>
#include <utility>

namespace bench {

SilentOutput::SilentOutput(Fill fill) : m_fill(std::move(fill)), m_thread([this] { loop(); }) {}

SilentOutput::~SilentOutput()
{
    m_ending = true;
    m_thread.join();
}

std::int64_t SilentOutput::framesHeard() const
{
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - m_start;
    return std::min(static_cast<std::int64_t>(elapsed.count() * ffmpeg::kSampleRate), m_given.load());
}

void SilentOutput::loop()
{
    std::vector<float> samples(2UL * kPart);
    auto next = m_start;
    while (!m_ending) {
        m_fill(samples.data(), kPart);
        m_given += kPart;
        next += std::chrono::milliseconds(20);
        std::this_thread::sleep_until(next);
    }
}

} // namespace bench
