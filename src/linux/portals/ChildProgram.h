/// A program that is started without a shell, and whose end is told. Main queue only; starting it does not block.
///
/// It may outlive this, and us: it is ended only on request.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace portals {

class ChildProgram {
public:
    /// Its exit status; kNotStarted; or 128 and the signal that has ended it.
    using Ended = std::function<void(int status)>;
    static constexpr int kNotStarted = -1;

    /// The first of `arguments` is looked for in PATH. `queue` outlives this. `ended` runs once, and not once this has gone.
    ChildProgram(base::MainQueue& queue, std::vector<std::string> arguments, Ended ended);
    ~ChildProgram();
    ChildProgram(const ChildProgram&) = delete;
    ChildProgram& operator=(const ChildProgram&) = delete;

    /// Asks it to end, if it still runs; also when it has not quite been started yet.
    void terminate();

private:
    struct State;

    std::shared_ptr<State> m_state;
    base::Affinity m_affinity;
};

} // namespace portals
