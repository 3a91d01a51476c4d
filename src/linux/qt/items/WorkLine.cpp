#include "linux/qt/items/WorkLine.h"

#include <cmath>
#include <limits>
#include <utility>

namespace qtui {

namespace {

/// Of a line that cannot say how far it is.
constexpr double kUnknownOpacity = 0.6;

QColor withOpacity(QColor color, double opacity)
{
    color.setAlphaF(static_cast<float>(opacity));
    return color;
}

} // namespace

WorkLine::WorkLine(Stage& stage) : PeerItem(stage)
{
    setZ(std::numeric_limits<float>::max());
}

void WorkLine::begin(std::optional<double> progress)
{
    assertHere();
    m_underWay = m_changed = true;
    m_progress = progress;
}

void WorkLine::end()
{
    assertHere();
    m_underWay = false;
    m_changed = true;
    m_progress.reset();
}

std::optional<int> WorkLine::percent() const
{
    assertHere();
    return m_progress ? std::optional(static_cast<int>(std::lround(*m_progress * 100))) : std::nullopt;
}

QString WorkLine::name() const
{
    assertHere();
    return QString::fromStdString(stage().words.text("WORK_NAME"));
}

QString WorkLine::percentText() const
{
    assertHere();
    if (!m_progress)
        return {};
    return QString::fromStdString(stage().words.text("WORK_PERCENT", {{"part", *percent() / 100.0}}));
}

void WorkLine::showIn(const QRectF& window)
{
    assertHere();
    const bool isSame = m_window == window && m_generation == stage().generation;
    if (!std::exchange(m_changed, false) && isSame)
        return;
    m_window = window;
    m_generation = stage().generation;
    const QRectF line(window.topLeft(), QSizeF(window.width(), kHeight));
    place(line, {});
    if (!m_underWay) {
        setSprites({});
        return;
    }
    const Theme& theme = stage().theme;
    // On the contrast's ground, because what lies under it can be any picture.
    std::vector<Sprite> sprites{{ownRect(), theme.focusContrast, {}}};
    QRectF done = ownRect();
    if (m_progress)
        done.setWidth(done.width() * *m_progress);
    sprites.push_back({done, m_progress ? theme.accent : withOpacity(theme.accent, kUnknownOpacity), {}});
    setSprites(std::move(sprites));
}

} // namespace qtui
