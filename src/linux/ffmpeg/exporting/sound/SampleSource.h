/// Gives sound as samples, from a start to an end. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstddef>
#include <vector>

namespace ffmpeg {

/// Samples by channel.
using Planes = std::vector<std::vector<float>>;

class SampleSource {
public:
    virtual ~SampleSource() = default;

    virtual int rate() const = 0;
    virtual int channels() const = 0;
    /// Appends up to `count` samples to each channel and tells how many; fewer only at the end. What cannot be read is
    /// silent; a negative AVERROR where reading was cancelled.
    virtual int read(Planes& into, int count) = 0;
    /// What its owner calls last before another thread goes on with it. Whoever has parts detaches them, too.
    virtual void detach() { m_affinity.detach(); }

protected:
    void assertHere(base::SourceLocation where = base::SourceLocation::current()) const
    {
        m_affinity.assertHere(where);
    }

private:
    base::Affinity m_affinity;
};

} // namespace ffmpeg
