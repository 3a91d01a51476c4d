/// A window whose root controller presents another one; a button behind it hears what should not reach it.
#pragma once

#include "Fixture.h"

#include "platform/views/Button.h"
#include "platform/views/Presentation.h"
#include "support/EnglishWords.h"

#include <algorithm>
#include <chrono>
#include <memory>
#include <string>
#include <vector>

namespace tests {

/// What is presented: as high as it was told, with a button at its top.
class Shown final : public platform::ViewController {
public:
    void viewDidLoad() override
    {
        button->setFrame(base::Rect::make(0, 0, 100, 44));
        view()->addSubview(button);
    }
    base::Size contentSizeThatFits(base::Size most) override
    {
        room = most;
        return {room.width, std::min(height, room.height)};
    }
    bool presentationShouldClose() override
    {
        ++asked;
        return allowsClosing;
    }
    void presentationDidShow() override { events.emplace_back("shown"); }
    void presentationDidEnd() override { events.emplace_back("ended"); }
    void viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                            platform::TransitionCoordinator& coordinator) override
    {
        ViewController::viewWillTransitionToSize_withTransitionCoordinator(size, coordinator);
        events.emplace_back("resized");
    }

    double height = 300;
    base::Size room; ///< that there was when it was asked last
    bool allowsClosing = true;
    int asked = 0;
    std::vector<std::string> events;
    std::shared_ptr<platform::Button> button = std::make_shared<platform::Button>();
};

struct Presenting : WindowFixture {
    std::shared_ptr<Controller> root = controller("root");
    std::shared_ptr<Target> target = std::make_shared<Target>();
    std::shared_ptr<platform::Button> behind = std::make_shared<platform::Button>();
    std::shared_ptr<Shown> shown = std::make_shared<Shown>();
    EnglishWords words;

    Presenting()
    {
        root->commands = {{platform::Key::Space, 0, false, runtime::Selector("command")},
                          {platform::Key::Escape, 0, false, runtime::Selector("command")}};
        window->setLog(machine.log);
        window->setRootViewController(root);
        window->setVisible(true);
        behind->setFrame(base::Rect::make(0, 0, 400, 800));
        behind->addTarget(target, Target::action(), platform::kTouchUpInside);
        root->view()->addSubview(behind);
        root->becomeFirstResponder();
        window->commit();
        taken();
    }

    void settle() { machine.advance(std::chrono::milliseconds(300)); }
    void present(bool animated = true)
    {
        root->present(shown, animated, [this] { shown->events.emplace_back("completed"); });
        window->commit();
    }
    void presentAndSettle()
    {
        present();
        settle();
        window->commit();
        shown->events.clear();
    }
    base::Rect surface() const { return window->topPresentation()->surface()->frame(); }
    std::shared_ptr<platform::View> dim() const { return window->topPresentation()->subviews().front(); }
    std::shared_ptr<platform::View> grabber() const { return window->topPresentation()->surface()->subviews().back(); }
    bool isGone() const { return !root->presentedViewController() && !window->topPresentation(); }
    void drag(double fromY, double toY, std::chrono::milliseconds step)
    {
        base::Instant now{0};
        window->touchDown({1, {200, fromY}, now});
        for (int i = 1; i <= 10; ++i)
            window->touchMove({1, {200, fromY + (toY - fromY) * i / 10}, now += step});
        window->commit();
        window->touchUp({1, {200, toY}, now});
        window->commit();
    }
};

} // namespace tests
