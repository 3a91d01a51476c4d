/// What is under way in the background, for those who show it and those who wait for its end. Any thread.
#pragma once

#include <functional>
#include <memory>
#include <optional>

namespace base {

/// One piece of work. It is under way until the last reference goes.
class Work {
public:
    virtual ~Work() = default;
    /// From 0 to 1; unknown until it is said.
    virtual void setProgress(double progress) = 0;
};

/// Works may outlive their list.
class WorkList {
public:
    WorkList();
    ~WorkList();

    [[nodiscard]] std::shared_ptr<Work> begin();

    bool isEmpty() const;
    /// Of all that is under way together, from 0 to 1; nothing when there is none, or when none of it is known.
    std::optional<double> progress() const;

    /// Called, on any thread, whenever one of the above may have changed; not after the list has gone. Takes the place of
    /// the former handler, which runs no more once this returns; not from inside of one.
    void setChangeHandler(std::function<void()> handler);

private:
    struct State;
    class Entry;
    std::shared_ptr<State> m_state;
};

} // namespace base
