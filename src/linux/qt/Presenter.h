/// Shows a window of views on the screen, and tells it what the user does. Made, used and ended on the GUI thread, after
/// the QGuiApplication and before the window of views ends.
///
/// Whatever changes in the tree is shown with the next picture; when nothing changes, nothing happens.
#pragma once

#include "base/Affinity.h"
#include "base/Clock.h"
#include "linux/qt/FontMeasuring.h"
#include "linux/qt/Theme.h"
#include "platform/files/MessageCatalog.h"
#include "platform/views/Window.h"

#include <QImage>

#include <functional>
#include <memory>
#include <optional>
#include <string>

class QQuickWindow;

namespace qtui {

class Announcer;
class Mirror;
class StageWindow;
class WorkLine;
struct Stage;
struct Statistics;

class Presenter {
public:
    /// Takes the window's size and gives it the screen's scale. `clock` moves the animations; `words` are what it says
    /// itself. Both outlive it.
    Presenter(std::shared_ptr<platform::Window> window, const base::Clock& clock,
              const platform::MessageCatalog& words);
    ~Presenter();

    void setTitle(const std::string& title);
    /// Called from the event loop when the user has asked to close the window; it stays open until `hide()` or until the
    /// presenter ends. Without a handler it closes by itself.
    void setCloseHandler(std::function<void()> handler);
    /// Called once, after the first picture on the screen that shows some of a movie.
    void setFirstPictureHandler(std::function<void()> handler);
    /// Follows the desktop until this is called.
    void setScheme(Scheme scheme);
    Scheme scheme() const;
    /// False spares weak devices the blurs: plain bars that let next to nothing through. True at first.
    void setLiveBlur(bool live);

    /// Makes the window's views appear, too.
    void show();
    void showFullScreen();
    void hide();

    /// Tells the user that something is under way in the background, beside the views: a thin line, and a progress bar
    /// for assistive technology. `progress` from 0 to 1, nothing when it is not known. May be said again.
    void showWork(std::optional<double> progress);
    void hideWork();

    /// Mirrors the tree now, instead of with the next picture. Does nothing when nothing has changed.
    void commit();
    /// Whether something was still on its way at the last commit: moving, growing or fading.
    bool isAnimating() const
    {
        m_affinity.assertHere();
        return m_animating;
    }
    /// Commits, and gives what stands on the screen, in pixels.
    QImage grab();

    /// The window for those who need one: parents of dialogs, tests.
    QQuickWindow& quickWindow();
    const Statistics& statistics() const;
    const Mirror& mirror() const;
    WorkLine& workLine()
    {
        m_affinity.assertHere();
        return *m_workLine;
    }

private:
    friend class StageWindow;

    void frameDue();
    void mirrorTree();
    void scheduleFrame();
    void takeScale();
    void takeSystemScheme();
    void redrawAll();
    bool closeRequested();
    void watchPictures();

    std::shared_ptr<platform::Window> m_window;
    const base::Clock& m_clock;
    FontMeasuring m_measuring;
    std::unique_ptr<Stage> m_stage;
    std::unique_ptr<StageWindow> m_quickWindow;
    std::unique_ptr<Mirror> m_mirror;
    std::unique_ptr<Announcer> m_announcer;
    std::unique_ptr<WorkLine> m_workLine;
    std::function<void()> m_closeHandler;
    std::function<void()> m_firstPictureHandler;
    bool m_schemeIsFixed = false;
    bool m_needsCommit = true;
    bool m_animating = false;
    base::Affinity m_affinity;
};

} // namespace qtui
