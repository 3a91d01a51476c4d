// The share sheet and alerts as people see them, and as assistive technology does. CLIPSA_GRABS names a directory for the
// pictures.
#include "Stage.h"

#include "linux/qt/StageWindow.h"
#include "linux/qt/accessibility/ViewAccessible.h"
#include "platform/sharing/ShareListView.h"
#include "platform/sharing/ShareSheet.h"
#include "platform/views/AlertController.h"
#include "platform/views/Presentation.h"
#include "support/FakeFileManager.h"

#include <QAccessible>
#include <QAccessibleValueInterface>
#include <QWheelEvent>

#include <chrono>
#include <cmath>

namespace tests {

namespace {

using platform::BarButtonItem;
using testing::ElementsAre;

class Way final : public platform::Activity {
public:
    Way(std::string title, std::string glyph) : m_title(std::move(title)), m_glyph(std::move(glyph)) {}
    std::string activityType() const override { return m_glyph; }
    std::string activityTitle() const override { return m_title; }
    std::string glyph() const override { return m_glyph; }
    void performActivity() override { noteProgress(0.6); }

private:
    std::string m_title;
    std::string m_glyph;
};

class Provider final : public platform::ActivityProvider {
public:
    void findActivities(const platform::ShareItems&, Found wanted) override { found = std::move(wanted); }
    Found found;
};

/// Something like the first picture of a game.
platform::ImageRef poster()
{
    platform::Bitmap bitmap = platform::Bitmap::transparent(162, 288);
    for (int y = 0; y < 288; ++y)
        for (int x = 0; x < 162; ++x) {
            const bool ground = y > 170 + 14 * std::sin(x / 24.0);
            std::uint8_t* pixel = bitmap.at(x, y);
            pixel[0] = static_cast<std::uint8_t>(ground ? 50 : 120 + y / 4);
            pixel[1] = static_cast<std::uint8_t>(ground ? 140 - y / 4 : 170);
            pixel[2] = static_cast<std::uint8_t>(ground ? 60 : 235 - y / 4);
            pixel[3] = 255;
        }
    return std::make_shared<platform::Image>(std::move(bitmap), 1);
}

class Sharing : public Stage {
protected:
    explicit Sharing(double atScale = 1) : Stage(atScale)
    {
        media.movies["/tmp/Marble Racer.mp4"] = FakeMovie::lasting(42);
        files.addFile("/tmp/Marble Racer.mp4", 12'400'000);
    }

    void fill(base::Size size, bool pad)
    {
        resize(size);
        window->setRootViewController(root);
        root->view()->setBackgroundColor({0.35, 0.6, 0.4, 1});
        const auto flexible = BarButtonItem::flexibleSpace();
        bar = std::make_shared<platform::Toolbar>(base::Rect::make(0, 0, size.width, 60));
        share = std::make_shared<BarButtonItem>(words, BarButtonItem::Kind::Action, target, Target::action());
        bar->setItems({flexible, share,
                       std::make_shared<BarButtonItem>(words, BarButtonItem::Kind::Save, target, Target::action())});
        root->view()->addSubview(bar);
        bar->setAutoresizingMask(platform::kFlexibleWidth);
        sheet = std::make_shared<platform::ShareSheet>(
            platform::ShareSheet::Services{words, media, files, provider, mainQueue,
                                           [](const base::Url&) { return "Marble Racer, 12 May 2024"; }},
            items, std::vector<std::shared_ptr<platform::Activity>>{});
        if (pad) {
            sheet->setModalPresentationStyle(platform::ModalPresentationStyle::Popover);
            sheet->setPopoverSource(share);
        }
        look();
    }
    std::vector<std::shared_ptr<platform::Activity>> ways(int count) const
    {
        const std::string longName = words.stretched ? "A device with a name that is far longer than it should be" : "";
        const std::vector<std::pair<std::string, std::string>> all = {
            {"Mail", "mail"},
            {"Message", "message"},
            {longName.empty() ? "Anna’s phone (KDE Connect)" : longName, "device"},
            {"Living room (Bluetooth)", "bluetooth"},
            {"Open with…", "open-with"},
            {"Save a copy…", "save-as"},
            {"Show in folder", "folder"},
            {"Save to Videos", "videos"},
            {"Copy", "copy"}};
        std::vector<std::shared_ptr<platform::Activity>> made;
        for (int i = 0; i < count; ++i)
            made.push_back(
                std::make_shared<Way>(all[static_cast<std::size_t>(i)].first, all[static_cast<std::size_t>(i)].second));
        return made;
    }
    void pass(int milliseconds)
    {
        for (int i = 0; i < milliseconds; i += 50) {
            clock.advance(std::chrono::milliseconds(50));
            worker.drain();
            mainQueue.drain();
            presenter->commit();
        }
    }
    void open(int count)
    {
        root->present(sheet, true);
        provider.found(ways(count), true);
        pass(50);
        media.imageGenerator()->succeed(0, poster());
        pass(400);
        look();
    }
    void tapOn(const platform::View& view)
    {
        const base::Point at = view.convertToRoot(view.bounds().center());
        window->touchDown({1, at, clock.now()});
        window->touchUp({1, at, clock.now()});
    }

    base::ManualQueue worker;
    base::MemoryLog log;
    base::System system{log, clock, mainQueue, worker, worker};
    FakeFileManager files{system};
    FakeMediaFramework media{mainQueue, center};
    Provider provider;
    platform::ShareItems items{"Marble Racer by Rolling Stones Studio", "https://example.org/apps/marble-racer",
                               base::Url::fromPath("/tmp/Marble Racer.mp4")};
    std::shared_ptr<platform::ViewController> root = std::make_shared<platform::ViewController>();
    std::shared_ptr<Target> target = std::make_shared<Target>();
    std::shared_ptr<platform::Toolbar> bar;
    std::shared_ptr<BarButtonItem> share;
    std::shared_ptr<platform::ShareSheet> sheet;
};

class SharingAtTwo : public Sharing {
protected:
    SharingAtTwo() : Sharing(2) {}
};

std::vector<std::string> spoken(QAccessibleInterface& parent)
{
    std::vector<std::string> all;
    for (int i = 0; i < parent.childCount(); ++i) {
        QAccessibleInterface* child = parent.child(i);
        const std::string kind = child->role() == QAccessible::Button        ? "button "
                                 : child->role() == QAccessible::ProgressBar ? "progress "
                                 : child->role() == QAccessible::Dialog      ? "dialog "
                                                                             : "text ";
        all.push_back(kind + child->text(QAccessible::Name).toStdString());
    }
    return all;
}

TEST_F(SharingAtTwo, ASheetOnAPhone)
{
    items.push_back(base::Url::fromPath("/tmp/log.txt"));
    fill({360, 720}, false);
    open(9);
    keep("share-phone-light");
    EXPECT_GT(inkIn(base::Rect::make(110, 620, 150, 60)), 100) << "there are rows";
    presenter->setScheme(qtui::Scheme::Dark);
    keep("share-phone-dark");
    window->moveFocus(true);
    window->moveFocus(true);
    keep("share-phone-dark-focus");
    window->clearFocus();
    tapOn(*sheet->list()->rows()[2]->row());
    pass(100);
    keep("share-phone-dark-running");
    presenter->setScheme(qtui::Scheme::Light);
    keep("share-phone-light-running");
}

TEST_F(SharingAtTwo, ASheetThatIsStillLooking)
{
    fill({360, 640}, false);
    root->present(sheet, true);
    provider.found(ways(2), false);
    pass(400);
    keep("share-phone-looking");
    EXPECT_GT(inkIn({sheet->list()->footerLabel()->convertToRoot({}), sheet->list()->footerLabel()->bounds().size}),
              50);
}

TEST_F(SharingAtTwo, ASheetFromRightToLeft)
{
    window->setRightToLeft(true);
    items[0] = std::string("سباق الكرات مع أصدقائي\nhttps://example.org/apps/marble-racer");
    fill({360, 640}, false);
    open(5);
    keep("share-phone-right-to-left");
    tapOn(*sheet->list()->rows()[0]->row());
    pass(100);
    keep("share-phone-right-to-left-running");
    EXPECT_LT(sheet->closeButton()->frame().minX(), 20);
}

TEST_F(SharingAtTwo, ASheetOfLongWords)
{
    words.stretched = true;
    items = {std::string(5000, 'w') + " and more", base::Url::fromPath("/tmp/Marble Racer.mp4")};
    fill({360, 640}, false);
    open(5);
    keep("share-phone-long-words");
    tapOn(*sheet->list()->rows()[2]->row());
    pass(100);
    keep("share-phone-long-words-running");
    const auto& row = *sheet->list()->rows()[2];
    EXPECT_LE(row.cancelButton()->frame().maxX(), 360);
    EXPECT_GE(row.cancelButton()->frame().width(), 44);
}

TEST_F(SharingAtTwo, APopoverOnAPad)
{
    fill({1024, 700}, true);
    open(6);
    keep("share-pad-light");
    presenter->setScheme(qtui::Scheme::Dark);
    keep("share-pad-dark");
    resize({700, 1000});
    pass(400);
    keep("share-pad-dark-upright");
    const auto& surface = *window->topPresentation()->surface();
    EXPECT_EQ(surface.frame().minX() + surface.arrow().position, share->view()->convertToRoot({22, 0}).x);
}

TEST_F(SharingAtTwo, AnAlert)
{
    fill({360, 640}, false);
    open(4);
    const auto alert = std::make_shared<platform::AlertController>(
        "“Anna’s phone” did not work",
        "“Marble Racer.mp4” did not reach “Anna’s phone”. Keep the devices close together, accept the file there, and "
        "share again.");
    alert->addAction({"Cancel", platform::AlertAction::Style::Cancel});
    alert->addAction({"Delete", platform::AlertAction::Style::Destructive});
    sheet->present(alert, true);
    pass(300);
    keep("alert-light");
    presenter->setScheme(qtui::Scheme::Dark);
    keep("alert-dark");
    EXPECT_EQ(alert->view()->bounds().size.width, 288);
}

TEST_F(Sharing, ItsColoursStandOutFromItsGround)
{
    for (const auto scheme : {qtui::Scheme::Light, qtui::Scheme::Dark}) {
        const qtui::Theme theme = qtui::Theme::forScheme(scheme);
        const auto over = [&](const QColor& color) {
            const auto mix = [&](double a, double b) { return a * color.alphaF() + b * (1 - color.alphaF()); };
            return QColor::fromRgbF(static_cast<float>(mix(color.redF(), theme.surface.redF())),
                                    static_cast<float>(mix(color.greenF(), theme.surface.greenF())),
                                    static_cast<float>(mix(color.blueF(), theme.surface.blueF())));
        };
        EXPECT_GE(contrast(theme.text, theme.surface), 7);
        EXPECT_GE(contrast(theme.accent, theme.surface), 4.5);
        EXPECT_GE(contrast(theme.destructive, theme.surface), 4.5);
        EXPECT_GE(contrast(over(theme.label({0, 0, 0, 0.7})), theme.surface), 4.5) << "what steps back";
        EXPECT_GE(contrast(over(theme.mark), theme.surface), 3);
        EXPECT_GE(contrast(theme.accent, over(theme.track)), 3) << "what is done, from what is not";
        EXPECT_GE(contrast(theme.text, over(theme.pressed)), 7);
    }
}

TEST_F(Sharing, AssistiveTechnologySeesOnlyWhatIsPresented)
{
    fill({360, 640}, false);
    QAccessibleInterface* top = QAccessible::queryAccessibleInterface(&presenter->quickWindow());
    ASSERT_TRUE(top);
    EXPECT_THAT(spoken(*top), ElementsAre("text "));
    open(2);
    ASSERT_THAT(spoken(*top), ElementsAre("dialog Share"));
    QAccessibleInterface* dialog = top->child(0);
    EXPECT_TRUE(dialog->state().modal);
    EXPECT_EQ(dialog->parent(), top);
    EXPECT_THAT(spoken(*dialog),
                ElementsAre("text Marble Racer, 12 May 2024", "text 42 s, 12400000 bytes",
                            "text Marble Racer by Rolling Stones Studio\nhttps://example.org/apps/marble-racer",
                            "button Close", "button Mail", "button Message"));
    dialog->child(4)->actionInterface()->doAction(QAccessibleActionInterface::pressAction());
    pass(50);
    EXPECT_THAT(spoken(*dialog), testing::Contains("progress Mail"));
    EXPECT_THAT(spoken(*dialog), testing::Contains("button Cancel"));
    for (int i = 0; i < dialog->childCount(); ++i)
        if (auto* each = dialog->child(i); each->role() == QAccessible::ProgressBar) {
            EXPECT_EQ(each->valueInterface()->currentValue().toDouble(), 0.6);
            EXPECT_EQ(each->valueInterface()->maximumValue().toDouble(), 1);
            EXPECT_TRUE(each->state().readOnly);
        }
    root->dismiss(true);
    pass(400);
    EXPECT_THAT(spoken(*top), ElementsAre("text ")) << "and everything again afterwards";
}

TEST_F(SharingAtTwo, ItsFirstPictureComesAtOnceHoweverMuchThereIsToSay)
{
    items[0] = std::string(1'000'000, 'w') + "\u202E";
    fill({360, 720}, false);
    const auto begin = std::chrono::steady_clock::now();
    root->present(sheet, true);
    presenter->commit();
    const std::chrono::duration<double, std::milli> passed = std::chrono::steady_clock::now() - begin;
    RecordProperty("milliseconds", std::to_string(passed.count()));
    EXPECT_LT(passed.count(), 1000) << "and far less on a machine that has nothing else to do";
}

TEST_F(SharingAtTwo, ASheetOnAPhoneThatLiesOnItsSide)
{
    fill({720, 360}, false);
    open(6);
    keep("share-phone-lying");
    EXPECT_GE(sheet->list()->bounds().height(), 2 * 56);
}

TEST_F(Sharing, ItIsToldOnceWhenItComes)
{
    fill({360, 640}, false);
    using Event = std::pair<QAccessible::Event, std::string>;
    std::vector<Event> events;
    qtui::Announcer announcer{[&](QAccessibleEvent* event) {
        events.emplace_back(event->type(), event->accessibleInterface()->text(QAccessible::Name).toStdString());
    }};
    auto& stage = dynamic_cast<qtui::StageWindow&>(presenter->quickWindow());
    open(2);
    announcer.announce(stage);
    announcer.announce(stage);
    EXPECT_THAT(events, ElementsAre(Event(QAccessible::ObjectShow, "Share"), Event(QAccessible::Alert, "Share")));
    root->dismiss(true);
    pass(400);
    announcer.announce(stage);
    EXPECT_EQ(events.size(), 2U);
}

TEST_F(Sharing, TheWheelScrollsItsList)
{
    fill({360, 480}, false);
    open(9);
    const auto& scroll = *sheet->list()->scrollView();
    const base::Point at = scroll.convertToRoot({100, 50});
    QWheelEvent wheel(QPointF(at.x, at.y), QPointF(at.x, at.y), {}, QPoint(0, -120), Qt::NoButton, Qt::NoModifier,
                      Qt::NoScrollPhase, false);
    QCoreApplication::sendEvent(&presenter->quickWindow(), &wheel);
    EXPECT_EQ(scroll.contentOffset(), 56);
}

} // namespace

} // namespace tests
