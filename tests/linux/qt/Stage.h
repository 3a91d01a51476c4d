/// What the suite shares: an application without a display, a window of views on it, and eyes and fingers for both.
#pragma once

#include "base/Clock.h"
#include "base/Queue.h"
#include "linux/qt/Mirror.h"
#include "linux/qt/Presenter.h"
#include "platform/views/BackdropView.h"
#include "platform/views/Button.h"
#include "platform/views/ImageView.h"
#include "platform/views/Label.h"
#include "platform/views/MovieScrubber.h"
#include "platform/views/Toolbar.h"
#include "support/EnglishWords.h"
#include "support/FakeMedia.h"

#include <QColor>
#include <QGuiApplication>
#include <QImage>
#include <QQuickWindow>

#include <gmock/gmock.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace tests {

/// Before main() returns: an application that ends with the statics comes after what it needs.
void endApplication();

/// Four colours: red and green above, blue and white below. Counts how often it was drawn, and how.
class QuarteredFrame final : public platform::VideoFrame {
public:
    explicit QuarteredFrame(base::Size size) : m_size(size) {}

    base::MediaTime time() const override { return base::MediaTime::zero(); }
    base::Size displaySize() const override { return m_size; }
    bool render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height, Quality quality) const override;

    mutable std::vector<Quality> renders;

private:
    base::Size m_size;
};

/// A target that answers "act:" and keeps who sent it.
class Target final : public runtime::Object {
public:
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }
    static runtime::Selector action() { return runtime::Selector("act:"); }

    void act(std::shared_ptr<runtime::Object> sender) { senders.push_back(std::move(sender)); }

    std::vector<std::shared_ptr<runtime::Object>> senders;
};

/// A view that keeps the touches that it gets, as "began 1 10,20".
class TouchedView final : public platform::View {
public:
    using View::View;

    void touchBegan(const platform::Touch& touch) override { note("began", touch); }
    void touchMoved(const platform::Touch& touch) override { note("moved", touch); }
    void touchEnded(const platform::Touch& touch) override { note("ended", touch); }
    void touchCancelled(const platform::Touch& touch) override { note("cancelled", touch); }

    std::vector<std::string> touches;
    std::vector<int> ids;

private:
    void note(const char* what, const platform::Touch& touch);
};

/// Is the scrubber's data source, and its delegate that remembers the last value.
class Movie final : public platform::MovieScrubberDataSource, public platform::MovieScrubberDelegate {
public:
    double movieScrubberDuration(platform::MovieScrubber&) override { return duration; }
    std::vector<double> movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(platform::MovieScrubber&,
                                                                                 std::int32_t count, double start,
                                                                                 double end) override;
    double movieScrubberThumbnailAspectRatio(platform::MovieScrubber&) override { return 1; }
    void movieScrubber_valueDidChange(platform::MovieScrubber&, double seconds) override { value = seconds; }
    void movieScrubberDidBeginScrubbing_withHandle(platform::MovieScrubber&, int) override {}
    void movieScrubberDidEndScrubbing_withHandle(platform::MovieScrubber&, int) override {}
    void movieScrubber_editingStartValueDidChange(platform::MovieScrubber&, double) override {}
    void movieScrubber_editingEndValueDidChange(platform::MovieScrubber&, double) override {}
    void movieScrubberDidBeginEditing(platform::MovieScrubber&) override {}
    void movieScrubberDidCancelEditing(platform::MovieScrubber&) override {}

    double duration = 10;
    double value = -1;
};

/// A window of 200 × 100 points, shown at the scale of the test.
class Stage : public ::testing::Test {
protected:
    explicit Stage(double scale = 1);
    ~Stage() override;

    template <typename V, typename... Arguments> std::shared_ptr<V> add(base::Rect frame, Arguments&&... arguments)
    {
        auto view = std::make_shared<V>(std::forward<Arguments>(arguments)...);
        view->setFrame(frame);
        window->addSubview(view);
        return view;
    }
    std::shared_ptr<platform::View> addColor(base::Rect frame, platform::Color color);
    /// A player whose picture fills `frame`, with its proportions kept.
    std::shared_ptr<FakePlayer>
    addPlayer(base::Rect frame, platform::VideoFrameRef picture,
              std::shared_ptr<FakePlayerItem> item = std::make_shared<FakePlayerItem>(nullptr));

    /// Delivers what waits: events, tasks, pictures.
    void settle();
    /// The same until `done`, or too long: a display answers when it likes.
    bool settleUntil(const std::function<bool()>& done);
    void resize(base::Size size);
    QImage look();
    /// The middle of the pixel at a place in points.
    QColor colorAt(double x, double y);
    /// How many pixels of `rect` (points) differ from the one at its left upper corner.
    int inkIn(base::Rect rect);
    /// Writes a picture for people into the directory that CLIPSA_GRABS names, if it does.
    void keep(const std::string& name);

    double scale;
    base::ManualClock clock;
    base::MainQueue mainQueue{clock};
    runtime::NotificationCenter center;
    EnglishWords words;
    std::shared_ptr<platform::Window> window;
    std::unique_ptr<qtui::Presenter> presenter;
};

class StageAtTwo : public Stage {
protected:
    StageAtTwo() : Stage(2) {}
};

constexpr platform::Color kRed{1, 0, 0, 1};
constexpr platform::Color kGreen{0, 1, 0, 1};
constexpr platform::Color kBlue{0, 0, 1, 1};

/// Of two colours, as for text on its ground: 1 to 21.
double contrast(const QColor& a, const QColor& b);

} // namespace tests
