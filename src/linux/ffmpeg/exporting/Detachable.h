/// What one thread at a time uses: whoever has it detaches it for the next.
#pragma once

#include "base/Affinity.h"

namespace ffmpeg {

class Detachable {
public:
    virtual ~Detachable() = default;

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
