/// A bar that fills as something goes on; where nobody knows how far it is, a piece of it runs along. Main queue only.
#pragma once

#include "platform/views/SurfaceView.h"

#include <memory>
#include <optional>

namespace platform {

class ProgressView final : public View {
public:
    static constexpr double kHeight = 4;

    explicit ProgressView(base::Rect frame = {});

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// From 0, as at first, to 1; nothing while it is not known.
    std::optional<double> progress() const { return here(m_progress); }
    /// `spoken` is how a person says it: "40 %".
    void setProgress(std::optional<double> progress, std::string spoken = {});

    void layoutSubviews() override;
    Accessibility accessibility() const override;

protected:
    void didMoveToWindow() override;

private:
    base::Rect fillFrame() const;
    void run();

    std::shared_ptr<SurfaceView> m_track;
    std::shared_ptr<SurfaceView> m_fill;
    std::optional<double> m_progress = 0;
    std::string m_spoken;
    bool m_runs = false;    ///< a next step is posted
    bool m_atStart = false; ///< the piece that runs along
};

/// Three dots that come and go: somebody is looking. Says nothing itself; a text stands beside it. Main queue only.
class ActivityIndicator final : public View {
public:
    static constexpr double kWidth = 28;
    static constexpr double kHeight = 8;

    explicit ActivityIndicator(base::Rect frame = {});

    /// Whether the dots move, which they do not at first: what moves costs a picture after the other, also unseen.
    void setAnimating(bool animating);

    void layoutSubviews() override;

protected:
    void didMoveToWindow() override;

private:
    void step();

    std::vector<std::shared_ptr<SurfaceView>> m_dots;
    std::size_t m_next = 0;
    bool m_isAnimating = false;
    bool m_runs = false; ///< a next step is posted
};

} // namespace platform
