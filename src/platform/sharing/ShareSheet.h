/// Shows what can be done with a movie and what goes along with it, and does it. Main queue only.
///
/// It is presented, as a sheet or a popover, and presented once. What can be done comes bit by bit: until the sheet is
/// fully on screen everything takes its place in the order, afterwards it goes to the end. The completion handler runs on
/// the main queue when the sheet is gone, once.
#pragma once

#include "platform/sharing/ActivityList.h"
#include "platform/sharing/ActivityProvider.h"
#include "platform/sharing/ShareSummary.h"
#include "platform/views/Button.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace platform {

class ActivityRow;
class ShareListView;

class ShareSheet final : public ViewController {
public:
    /// An activity that was asked to end may take so long; then the sheet goes without it.
    static constexpr base::Instant kPatience = std::chrono::seconds(1);

    /// What it works with; all of them outlive it.
    struct Services {
        const MessageCatalog& words;
        MediaFramework& media;
        FileManager& files;
        ActivityProvider& provider;
        base::MainQueue& mainQueue;
        /// What the movie is called at the sheet's top; its file's name where there is no function.
        std::function<std::string(const base::Url& movie)> movieName = {};
        /// Told of each activity that was performed, while the sheet is there.
        std::function<void(const Activity& activity, const Activity::End& end)> activityEnded = {};
    };
    /// `activityType` is empty when nothing was done. `error` is why something was not, null when the user wanted it so.
    using CompletionHandler = std::function<void(const std::string& activityType, bool completed,
                                                 const ShareItems& returnedItems, const base::ErrorRef& error)>;

    /// `activities` are the application's own, beside those that the provider finds.
    ShareSheet(Services services, ShareItems items, std::vector<std::shared_ptr<Activity>> activities);
    ~ShareSheet() override;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    // Before it is presented.
    void setExcludedActivityTypes(std::vector<std::string> types);
    /// These first, in that order.
    void setActivityTypeOrder(std::vector<std::string> types);
    void setCompletionHandler(CompletionHandler handler) { here(m_handler) = std::move(handler); }

    /// What was performed last: whoever hears of the end may ask it with whom.
    const std::shared_ptr<Activity>& performedActivity() const { return here(m_performed); }
    bool isPerforming() const { return here(m_running) != nullptr; }

    void viewDidLoad() override;
    void viewDidLayoutSubviews() override;
    base::Size contentSizeThatFits(base::Size room) override;
    void presentationDidShow() override;
    std::shared_ptr<View> preferredFocusView() override;
    bool presentationShouldClose() override;
    void presentationDidEnd() override;
    void presentedViewControllerDidEnd(ViewController& presented) override;

    // Answers its own parts.
    void closePressed();
    void rowPicked(std::shared_ptr<runtime::Object> row);
    void cancelPressed();

    // For those who look at it: tests.
    const ShareItems& activityItems() const { return here(m_items); }
    const ActivityList& activityList() const { return here(m_activities); }
    const std::shared_ptr<ShareSummary>& summary() const { return here(m_summary); }
    const std::shared_ptr<ShareListView>& list() const { return here(m_list); }
    const std::shared_ptr<Button>& closeButton() const { return here(m_closeButton); }

private:
    struct Outcome {
        std::string type;
        bool completed = false;
        base::ErrorRef error;
    };

    void addFound(const std::vector<std::shared_ptr<Activity>>& activities, bool isLast);
    void perform(const std::shared_ptr<Activity>& activity);
    void performInRow(const std::shared_ptr<Activity>& activity);
    void activityEnded(const Activity& activity, const Activity::End& end);
    void activityProgressed(const Activity& activity, std::optional<double> progress) const;
    void goBackToList();
    void showError(const Activity& activity, const base::ErrorRef& error);
    /// For good: takes itself away.
    void close();
    /// While one is performed.
    std::shared_ptr<ActivityRow> runningRow() const;

    Services m_services;
    ShareItems m_items;
    ActivityList m_activities;
    CompletionHandler m_handler;
    Outcome m_outcome;
    std::shared_ptr<Activity> m_running;
    std::shared_ptr<Activity> m_performed;
    std::weak_ptr<ViewController> m_activityController; ///< that it shows, in place of performing it
    bool m_isClosing = false;
    double m_listHeight = 0; ///< that was asked for last
    std::shared_ptr<ShareSummary> m_summary;
    std::shared_ptr<ShareListView> m_list;
    std::shared_ptr<Button> m_closeButton;
    std::shared_ptr<View> m_separator;
};

} // namespace platform
