/// What the suites of views share: a driven main queue, and objects that write down what they are told.
#pragma once

#include "platform/views/Control.h"
#include "platform/views/ViewController.h"
#include "platform/views/Window.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <functional>
#include <string>
#include <vector>

namespace tests {

/// A target that answers "act:" and keeps who sent it.
class Target final : public runtime::Object {
public:
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance =
            runtime::ClassBuilder<Target>("TestTarget", &Object::classObject()).method("act:", &Target::act).build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    static runtime::Selector action() { return runtime::Selector("act:"); }

    void act(std::shared_ptr<runtime::Object> sender)
    {
        senders.push_back(sender);
        if (onAct)
            onAct();
    }

    std::vector<std::shared_ptr<runtime::Object>> senders;
    std::function<void()> onAct;
};

/// A controller that writes down its calls in a list that several may share.
class Controller : public platform::ViewController {
public:
    explicit Controller(std::string name, std::shared_ptr<std::vector<std::string>> calls)
        : m_name(std::move(name)), m_calls(std::move(calls))
    {
    }

    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance =
            runtime::ClassBuilder<Controller>("TestController", &ViewController::classObject())
                .method("command", &Controller::command)
                .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    void viewDidLoad() override { say("didLoad"); }
    void viewWillAppear(bool) override
    {
        say("willAppear");
        if (onWillAppear)
            onWillAppear();
    }
    void viewDidAppear(bool) override { say("didAppear"); }
    void viewWillDisappear(bool) override { say("willDisappear"); }
    void viewDidDisappear(bool) override { say("didDisappear"); }
    void viewDidLayoutSubviews() override { ++layouts; }
    void willMoveToParentViewController(ViewController* parent) override
    {
        ViewController::willMoveToParentViewController(parent);
        say(parent ? "willMove" : "willMoveToNothing");
    }
    void didMoveToParentViewController(ViewController* parent) override
    {
        ViewController::didMoveToParentViewController(parent);
        say(parent ? "didMove" : "didMoveToNothing");
    }
    void viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                            platform::TransitionCoordinator& coordinator) override
    {
        ViewController::viewWillTransitionToSize_withTransitionCoordinator(size, coordinator);
        if (onTransition)
            onTransition(size, coordinator);
    }
    bool canBecomeFirstResponder() const override { return true; }
    void motionEnded_withEvent(platform::MotionSubtype motion, const platform::MotionEvent& event) override
    {
        if (!handlesMotion)
            ViewController::motionEnded_withEvent(motion, event);
        else if (motion == platform::MotionSubtype::Shake)
            say("shake");
    }
    std::vector<platform::KeyCommand> keyCommands() const override { return commands; }
    void command() { say("command"); }

    std::function<void()> onWillAppear;
    std::function<void(base::Size, platform::TransitionCoordinator&)> onTransition;
    std::vector<platform::KeyCommand> commands;
    bool handlesMotion = false;
    int layouts = 0;

private:
    void say(const std::string& what) { m_calls->push_back(m_name + " " + what); }

    std::string m_name;
    std::shared_ptr<std::vector<std::string>> m_calls;
};

struct WindowFixture : testing::Test {
    TestSystem machine;
    std::shared_ptr<std::vector<std::string>> calls = std::make_shared<std::vector<std::string>>();
    std::shared_ptr<platform::Window> window =
        std::make_shared<platform::Window>(machine.mainQueue, base::Size{400, 800}, 2.0);

    std::shared_ptr<Controller> controller(const std::string& name)
    {
        return std::make_shared<Controller>(name, calls);
    }
    std::vector<std::string> taken() { return std::exchange(*calls, {}); }

    template <typename T = platform::View>
    std::shared_ptr<T> add(base::Rect frame, const std::shared_ptr<platform::View>& to)
    {
        auto view = std::make_shared<T>(frame);
        to->addSubview(view);
        return view;
    }

    void tap(double x, double y)
    {
        window->touchDown({1, {x, y}, {}});
        window->touchUp({1, {x, y}, {}});
    }
};

} // namespace tests
