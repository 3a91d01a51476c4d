/// An editor in a window over fakes of every role, with helpers to tap it and to read its bars. Main thread only.
#pragma once

#include "editor/VKVideoEditorViewController.h"
#include "support/FakePlatform.h"
#include "support/VKFileManagerExtensions.h"

#include <gtest/gtest.h>

#include <cmath>

/// Stands between the window and the editor, as the extension's controller does, and sees what the editor passes on.
class Container final : public platform::ViewController {
public:
    int motions = 0;
    void motionEnded_withEvent(platform::MotionSubtype motion, const platform::MotionEvent& event) override
    {
        ++motions;
        ViewController::motionEnded_withEvent(motion, event);
    }
};

class FinishRecorder final : public VKVideoEditorViewControllerDelegate {
public:
    std::vector<std::shared_ptr<ActivityTypes>> finishes;
    void videoEditor_didFinishWithActivityTypes(VKVideoEditorViewController& /*editor*/,
                                                const std::shared_ptr<ActivityTypes>& activityTypes) override
    {
        finishes.push_back(activityTypes);
    }
};

class EditorTest : public testing::Test {
protected:
    static constexpr const char* kMovie = "/movie.mp4";

    std::unique_ptr<tests::FakePlatform> fake;
    std::shared_ptr<Container> container;
    std::shared_ptr<VKVideoEditorViewController> editor;
    std::shared_ptr<FinishRecorder> delegate = std::make_shared<FinishRecorder>();

    void SetUp() override { makePlatform(tests::FakePlatform::kPhone); }
    void TearDown() override { close(); }

    void close()
    {
        // An export that runs on keeps its editor.
        if (const auto session = fake->media.exportSession(); session && session->isRunning())
            session->finish(platform::ExportSession::Status::Cancelled);
        editor.reset();
        if (container)
            fake->window->setRootViewController(nullptr);
        container.reset();
        fake->machine.drain();
    }

    void makePlatform(base::Size size)
    {
        fake = std::make_unique<tests::FakePlatform>(size);
        fake->media.movies[kMovie] = tests::FakeMovie::lasting(10);
    }
    /// Makes the editor, shows it in the window and lets the movie load.
    void open(std::optional<base::Url> url = base::Url::fromPath(kMovie))
    {
        container = std::make_shared<Container>();
        fake->window->setRootViewController(container);
        fake->window->setVisible(true);
        editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
            fake->platform, "org.example.Game", std::move(url), "Game", std::nullopt, container->view()->bounds());
        editor->setDelegate(delegate);
        container->addChildViewController(editor);
        container->view()->addSubview(editor->view());
        editor->didMoveToParentViewController(container.get());
        settle();
    }
    void settle()
    {
        fake->machine.drain();
        fake->window->commit();
    }
    void turnTo(base::Size size)
    {
        fake->window->transitionToSize(size);
        fake->machine.advance(platform::Window::kTransitionDuration);
        fake->window->commit();
    }
    /// Enters trim mode and moves both handles, in seconds.
    void trimFrom(double start, double end)
    {
        editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
        editor->movieScrubber_editingStartValueDidChange(*editor->avTrimmer(), start);
        editor->movieScrubber_editingEndValueDidChange(*editor->avTrimmer(), end);
        settle();
    }
    void tap(double x, double y)
    {
        fake->window->touchDown({1, {x, y}, {}});
        fake->window->touchUp({1, {x, y}, {}});
        settle();
    }
    void tap(const std::shared_ptr<platform::View>& view)
    {
        const base::Point middle = view->convertToRoot({view->frame().width() / 2, view->frame().height() / 2});
        tap(middle.x, middle.y);
    }

    using Items = platform::Toolbar::Items;
    Items phoneTop(const std::shared_ptr<platform::BarButtonItem>& first,
                   const std::shared_ptr<platform::BarButtonItem>& last) const
    {
        return {first, editor->flexSpace(), editor->titleButton(), editor->flexSpace(), last};
    }
    Items pad(const std::shared_ptr<platform::BarButtonItem>& first,
              const std::vector<std::shared_ptr<platform::BarButtonItem>>& rest) const
    {
        Items items{first, editor->flexSpace(), editor->titleButton(), editor->flexSpace()};
        for (std::size_t i = 0; i < rest.size(); ++i) {
            if (i > 0)
                items.push_back(editor->fixSpace());
            items.push_back(rest[i]);
        }
        return items;
    }
    const Items& top() const { return editor->topToolBar()->items(); }
    const Items& bottom() const { return editor->bottomToolBar()->items(); }
    base::Rect stripFrame() const { return editor->scrubberContainterView()->frame(); }
    tests::FakePlayer& player() const { return *fake->media.player(); }
};
