#include "runtime/NotificationCenter.h"
#include "runtime/Object.h"

#include <gmock/gmock.h>

#include <functional>
#include <string>
#include <vector>

namespace {

using runtime::Selector;
using testing::ElementsAre;

class Player final : public runtime::Object {
public:
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance =
            runtime::ClassBuilder<Player>("TestPlayer", &Object::classObject()).method("took:", &Player::took).build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    void change(const char* key) { didChangeValueForKey(key); }
    void took(std::shared_ptr<runtime::Object> sender)
    {
        senders.push_back(sender);
        if (onTook)
            onTook();
    }

    std::vector<std::shared_ptr<runtime::Object>> senders;
    std::function<void()> onTook;
};

struct Observer final : runtime::KeyValueObserver {
    void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, runtime::Object& object,
                                                        const runtime::KeyValueChange&, void* context) override
    {
        keys.emplace_back(keyPath);
        contexts.push_back(context);
        if (onChange)
            onChange(object);
    }

    std::vector<std::string> keys;
    std::vector<void*> contexts;
    std::function<void(runtime::Object&)> onChange;
};

TEST(KeyValueObserving, AnObserverIsToldOfItsKeysOnly)
{
    const auto player = std::make_shared<Player>();
    Observer observer;
    int context = 0;
    player->addObserver(observer, "rate", &context);
    player->change("rate");
    player->change("status");
    EXPECT_THAT(observer.keys, ElementsAre("rate"));
    EXPECT_THAT(observer.contexts, ElementsAre(&context));
    player->removeObserver(observer, "rate");
    player->change("rate");
    EXPECT_EQ(observer.keys.size(), 1U);
}

TEST(KeyValueObserving, RemovingWhatIsNotObservedDoesNothing)
{
    const auto player = std::make_shared<Player>();
    Observer observer;
    player->removeObserver(observer, "rate");
    EXPECT_EQ(player->observerCount(), 0U);
}

TEST(KeyValueObserving, AnObserverMayRemoveItselfWhileItIsTold)
{
    const auto player = std::make_shared<Player>();
    Observer first;
    Observer second;
    first.onChange = [&](runtime::Object& object) { object.removeObserver(first, "rate"); };
    player->addObserver(first, "rate");
    player->addObserver(second, "rate");
    player->change("rate");
    player->change("rate");
    EXPECT_EQ(first.keys.size(), 1U);
    EXPECT_EQ(second.keys.size(), 2U);
}

TEST(KeyValueObserving, AnObserverThatWasRemovedMeanwhileIsNotTold)
{
    const auto player = std::make_shared<Player>();
    Observer first;
    Observer second;
    first.onChange = [&](runtime::Object& object) { object.removeObserver(second, "rate"); };
    player->addObserver(first, "rate");
    player->addObserver(second, "rate");
    player->change("rate");
    EXPECT_TRUE(second.keys.empty());
}

TEST(KeyValueObserving, TheLatestOfTwoEntriesGoesFirst)
{
    const auto player = std::make_shared<Player>();
    Observer observer;
    int one = 0;
    int two = 0;
    player->addObserver(observer, "rate", &one);
    player->addObserver(observer, "rate", &two);
    observer.onChange = [&](runtime::Object& object) {
        observer.onChange = nullptr;
        object.removeObserver(observer, "rate");
    };
    player->change("rate");
    EXPECT_THAT(observer.contexts, ElementsAre(&one));
    EXPECT_EQ(player->observerCount(), 1U);
}

TEST(KeyValueObserving, TheObjectMayBeReleasedWhileItsObserversAreTold)
{
    auto player = std::make_shared<Player>();
    Observer first;
    Observer second;
    first.onChange = [&](runtime::Object&) { player.reset(); };
    player->addObserver(first, "rate");
    player->addObserver(second, "rate");
    player->change("rate");
    EXPECT_EQ(second.keys.size(), 1U);
}

TEST(TargetActions, TheTargetGetsTheMessageWithItsSender)
{
    const auto target = std::make_shared<Player>();
    const auto sender = std::make_shared<Player>();
    const runtime::TargetAction action(target, Selector("took:"));
    EXPECT_TRUE(action.isAnswered());
    action.send(sender);
    EXPECT_THAT(target->senders, ElementsAre(sender));
}

TEST(TargetActions, ADeadTargetIsNotSentAnything)
{
    auto target = std::make_shared<Player>();
    const runtime::TargetAction action(target, Selector("took:"));
    target.reset();
    EXPECT_FALSE(action.isAnswered());
    action.send(nullptr);
}

TEST(TargetActions, ATargetThatDoesNotAnswerIsLeftAlone)
{
    const auto target = std::make_shared<Player>();
    const runtime::TargetAction unknown(target, Selector("gave:"));
    EXPECT_FALSE(unknown.isAnswered());
    unknown.send(nullptr);
    const runtime::TargetAction nothing(target, Selector());
    EXPECT_FALSE(nothing.isAnswered());
    nothing.send(nullptr);
    EXPECT_FALSE(runtime::TargetAction().isAnswered());
    EXPECT_TRUE(target->senders.empty());
}

TEST(Notifications, ObserversAreToldOfTheNameAndObjectThatTheyAskedFor)
{
    runtime::NotificationCenter center;
    const auto observer = std::make_shared<Player>();
    const auto movie = std::make_shared<Player>();
    const auto other = std::make_shared<Player>();
    center.addObserver(observer, Selector("took:"), "ended", movie);
    center.post("ended", movie);
    center.post("ended", other);
    center.post("began", movie);
    ASSERT_EQ(observer->senders.size(), 1U);
    const auto notification = std::dynamic_pointer_cast<runtime::Notification>(observer->senders.front());
    ASSERT_TRUE(notification);
    EXPECT_EQ(notification->name(), "ended");
    EXPECT_EQ(notification->object(), movie);
}

TEST(Notifications, AnyObjectMeansEveryObject)
{
    runtime::NotificationCenter center;
    const auto observer = std::make_shared<Player>();
    center.addObserver(observer, Selector("took:"), "ended", nullptr);
    center.post("ended", std::make_shared<Player>());
    center.post("ended", nullptr);
    EXPECT_EQ(observer->senders.size(), 2U);
}

TEST(Notifications, AnObjectThatIsGoneIsNotTakenForNoObject)
{
    runtime::NotificationCenter center;
    const auto observer = std::make_shared<Player>();
    center.addObserver(observer, Selector("took:"), "ended", std::make_shared<Player>());
    center.post("ended", nullptr);
    EXPECT_TRUE(observer->senders.empty());
}

TEST(Notifications, ObserversThatAreGoneAreForgotten)
{
    runtime::NotificationCenter center;
    for (int i = 0; i < 100; ++i)
        center.addObserver(std::make_shared<Player>(), Selector("took:"), "ended", nullptr);
    center.post("ended", nullptr);
    EXPECT_LE(center.registrationCount(), 1U);
}

TEST(Notifications, AnObserverThatIsTakenBackMeanwhileIsNotTold)
{
    runtime::NotificationCenter center;
    const auto first = std::make_shared<Player>();
    const auto second = std::make_shared<Player>();
    first->onTook = [&] { center.removeObserver(*second); };
    center.addObserver(first, Selector("took:"), "ended", nullptr);
    center.addObserver(second, Selector("took:"), "ended", nullptr);
    center.post("ended", nullptr);
    EXPECT_TRUE(second->senders.empty());
    EXPECT_EQ(center.registrationCount(), 1U);
}

} // namespace
