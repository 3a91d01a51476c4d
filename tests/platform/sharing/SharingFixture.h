/// A share sheet on a window of its own, with activities that end when a test says so.
#pragma once

#include "platform/sharing/ActivityProvider.h"
#include "platform/sharing/ActivityRow.h"
#include "platform/sharing/ShareListView.h"
#include "platform/sharing/ShareSheet.h"
#include "platform/views/AlertController.h"
#include "platform/views/Presentation.h"
#include "platform/views/Window.h"
#include "support/EnglishWords.h"
#include "support/FakeFileManager.h"
#include "support/FakeMedia.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tests {

class DrivenActivity final : public platform::Activity {
public:
    explicit DrivenActivity(std::string type, std::string title = "")
        : m_type(std::move(type)), m_title(std::move(title))
    {
    }

    std::string activityType() const override { return m_type; }
    std::string activityTitle() const override { return m_title.empty() ? m_type : m_title; }
    std::string glyph() const override { return "share"; }
    platform::ImageRef activityImage() const override { return image; }
    bool canPerformWithActivityItems(const platform::ShareItems&) const override { return canPerform; }
    void prepareWithActivityItems(const platform::ShareItems& items) override { prepared = items; }
    std::shared_ptr<platform::ViewController> activityViewController() override { return controller; }
    void performActivity() override
    {
        ++performed;
        if (endsAtOnce)
            activityDidFinish(true);
    }
    void cancel() override
    {
        ++cancelled;
        if (endsWhenCancelled)
            activityDidFinish(hasBeenTaken);
    }
    void tell(std::optional<double> progress) const { noteProgress(progress); }

    bool canPerform = true;
    bool endsAtOnce = false;
    bool endsWhenCancelled = true;
    bool hasBeenTaken = false; ///< by its receiver, when it is cancelled
    int performed = 0;
    int cancelled = 0;
    platform::ShareItems prepared;
    platform::ImageRef image;
    std::shared_ptr<platform::ViewController> controller;

private:
    std::string m_type;
    std::string m_title;
};

class DrivenProvider final : public platform::ActivityProvider {
public:
    void findActivities(const platform::ShareItems& items, Found wanted) override
    {
        asked.push_back(items);
        found = std::move(wanted);
    }
    std::vector<platform::ShareItems> asked;
    Found found;
};

inline base::ErrorRef error(const std::string& why)
{
    return base::Error::make("test", 1, why);
}

struct Sharing : testing::Test {
    TestSystem machine;
    runtime::NotificationCenter center;
    FakeMediaFramework media{machine.mainQueue, center};
    FakeFileManager files{machine.system};
    EnglishWords words;
    DrivenProvider provider;
    std::shared_ptr<platform::Window> window =
        std::make_shared<platform::Window>(machine.mainQueue, base::Size{400, 800}, 2.0);
    std::shared_ptr<platform::ViewController> root = std::make_shared<platform::ViewController>();
    platform::ShareItems items{"A race", base::Url::fromPath("/tmp/race.mp4")};
    std::shared_ptr<platform::ShareSheet> sheet;
    std::vector<std::string> results; ///< "TYPE yes", "TYPE no WHY"
    std::vector<std::string> ended;   ///< while the sheet is there: "TYPE yes", "TYPE no"

    Sharing()
    {
        files.addFile("/tmp/race.mp4", 12'400'000);
        media.movies["/tmp/race.mp4"] = FakeMovie::lasting(42);
        window->setRootViewController(root);
        window->setVisible(true);
        window->commit();
    }

    std::shared_ptr<DrivenActivity> activity(const std::string& type) { return std::make_shared<DrivenActivity>(type); }
    platform::ShareSheet& make(std::vector<std::shared_ptr<platform::Activity>> extra = {})
    {
        sheet = std::make_shared<platform::ShareSheet>(
            platform::ShareSheet::Services{
                words,
                media,
                files,
                provider,
                machine.mainQueue,
                {},
                [this](const platform::Activity& activity, const platform::Activity::End& end) {
                    ended.push_back(activity.activityType() + (end.completed ? " yes" : " no"));
                }},
            items, std::move(extra));
        sheet->setCompletionHandler(
            [this](const std::string& type, bool completed, const platform::ShareItems&, const base::ErrorRef& error) {
                EXPECT_FALSE(sheet->presentingViewController()) << "it has gone";
                results.push_back(type + (completed ? " yes" : " no") + (error ? " " + error->description() : ""));
            });
        return *sheet;
    }
    void begin()
    {
        root->present(sheet, true);
        window->commit();
    }
    void settle()
    {
        machine.advance(std::chrono::milliseconds(300));
        window->commit();
    }
    /// A sheet with these, fully on screen.
    void open(const std::vector<std::shared_ptr<platform::Activity>>& activities)
    {
        make();
        begin();
        provider.found(activities, true);
        window->commit();
        settle();
        settle(); // where it grew on its way up
    }
    std::vector<std::string> titles() const
    {
        std::vector<std::string> all;
        for (const auto& row : sheet->list()->rows())
            all.push_back(row->row()->title());
        return all;
    }
    std::shared_ptr<platform::ActivityRow> row(std::size_t index) const { return sheet->list()->rows().at(index); }
    void tapOn(const platform::View& view)
    {
        const base::Point at = view.convertToRoot({view.bounds().width() / 2, view.bounds().height() / 2});
        window->touchDown({1, at, {}});
        window->touchUp({1, at, {}});
        window->commit();
    }
    void tapRow(std::size_t index) { tapOn(*row(index)->row()); }
    bool isGone() const { return !root->presentedViewController(); }
    /// Takes the sheet away with all that is below it, before anything else can happen.
    void dropEverything()
    {
        window->setRootViewController(std::make_shared<platform::ViewController>());
        root.reset();
        sheet.reset();
    }
};

} // namespace tests
