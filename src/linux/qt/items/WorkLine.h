/// The thin line along the window's upper edge while something is under way in the background. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

#include <optional>

namespace qtui {

class WorkLine final : public PeerItem {
public:
    static constexpr double kHeight = 3; ///< points

    explicit WorkLine(Stage& stage);

    /// Begins, or goes on; nothing when it is not known how far the work is. From 0 to 1.
    void begin(std::optional<double> progress);
    void end();

    bool isUnderWay() const { return here(m_underWay); }
    std::optional<double> progress() const { return here(m_progress); }
    // As people are told of it: what is under way, and how far it is, in whole percents and in words.
    QString name() const;
    std::optional<int> percent() const;
    QString percentText() const;

    /// Draws itself along the upper edge of `window`, if something is under way.
    void showIn(const QRectF& window);

private:
    bool m_underWay = false;
    std::optional<double> m_progress;
    bool m_changed = false;
    QRectF m_window;
    std::uint64_t m_generation = 0;
};

} // namespace qtui
