/// The window on the screen, as far as Qt is concerned: hands events to the presenter. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "linux/qt/input/InputFeed.h"

#include <QQuickItem>
#include <QQuickWindow>

#include <atomic>

namespace qtui {

class Mirror;
class Presenter;
class WorkLine;

/// Where the items hang; tells when a picture is due.
class RootItem final : public QQuickItem {
public:
    explicit RootItem(std::function<void()> due) : m_due(std::move(due)) {}

protected:
    void updatePolish() override { m_due(); }

private:
    std::function<void()> m_due;
};

class StageWindow final : public QQuickWindow {
public:
    StageWindow(Presenter& presenter, platform::Window& views, const base::Clock& clock);
    ~StageWindow() override;

    RootItem& root()
    {
        m_affinity.assertHere();
        return m_root;
    }
    InputFeed& input()
    {
        m_affinity.assertHere();
        return m_input;
    }
    platform::Window& views() const
    {
        m_affinity.assertHere();
        return m_views;
    }
    const Mirror& mirror() const;
    WorkLine& workLine() const;

    QAccessibleInterface* accessibleRoot() const override;

protected:
    bool event(QEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    base::Affinity m_affinity;
    Presenter& m_presenter;
    platform::Window& m_views;
    InputFeed m_input;
    RootItem m_root;
};

} // namespace qtui
