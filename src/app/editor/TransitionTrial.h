/// Changes the size of the editor's window again and again, and says whether the thousandth time costs more than the
/// first. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "base/Clock.h"

#include <cstdint>
#include <string>
#include <vector>

namespace app {

class EditorProgram;

/// What this process has in memory.
long residentKilobytes();

class TransitionTrial {
public:
    /// The first ones warm up, and are not counted.
    static constexpr int kWarmUp = 100;
    static constexpr int kSample = 100;

    /// `count` transitions after the warm-up.
    TransitionTrial(EditorProgram& program, int count);

    /// Starts the next transition when the last one has been made and mirrored, or waits for that; true when all have
    /// been made. Call it again and again from the event loop.
    bool goOn();
    std::uint64_t count() const
    {
        m_affinity.assertHere();
        return m_times.size();
    }

    /// "transitions 1000 first 0.512 last 0.530 memory 81234 81300": means of the first and the last hundred in
    /// milliseconds of processor time, kilobytes after the warm-up and at the end.
    std::string result() const;

private:
    base::Affinity m_affinity;
    EditorProgram& m_program;
    const std::size_t m_wanted;
    std::uint64_t m_before = 0;
    base::Instant m_started{0};
    std::vector<base::Instant> m_times;
    long m_warmMemory = 0;
    bool m_running = false;
};

} // namespace app
