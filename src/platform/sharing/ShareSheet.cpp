#include "platform/sharing/ShareSheet.h"

#include "platform/sharing/ShareListView.h"
#include "platform/views/SurfaceView.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

constexpr double kCloseSize = 44;
constexpr double kCloseMargin = 4;

const runtime::Selector& closeSelector()
{
    static const runtime::Selector selector("closePressed");
    return selector;
}

const runtime::Selector& pickSelector()
{
    static const runtime::Selector selector("rowPicked:");
    return selector;
}

const runtime::Selector& cancelSelector()
{
    static const runtime::Selector selector("cancelPressed");
    return selector;
}

std::string nameOfMovie(const ShareSheet::Services& services, const ShareItems& items)
{
    const auto files = filesOf(items);
    if (files.empty())
        return {};
    const std::string name = services.movieName ? services.movieName(files.front()) : "";
    return name.empty() ? files.front().lastPathComponent() : name;
}

} // namespace

ShareSheet::ShareSheet(Services services, ShareItems items, std::vector<std::shared_ptr<Activity>> activities)
    : m_services(std::move(services)), m_items(std::move(items)), m_activities(m_items)
{
    setTitle(m_services.words.text("BAR_SHARE"));
    m_activities.add(activities);
}

ShareSheet::~ShareSheet()
{
    assertHere();
}

const runtime::Class& ShareSheet::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ShareSheet>("ShareSheet", &ViewController::classObject())
            .method(closeSelector().name(), &ShareSheet::closePressed)
            .method(pickSelector().name(), &ShareSheet::rowPicked)
            .method(cancelSelector().name(), &ShareSheet::cancelPressed)
            .build();
    return instance;
}

const runtime::Class& ShareSheet::isa() const
{
    return classObject();
}

void ShareSheet::setExcludedActivityTypes(std::vector<std::string> types)
{
    assertHere();
    m_activities.setExcludedTypes(std::move(types));
}

void ShareSheet::setActivityTypeOrder(std::vector<std::string> types)
{
    assertHere();
    m_activities.setTypeOrder(std::move(types));
}

void ShareSheet::viewDidLoad()
{
    assertHere();
    const auto weak = weakSelf<ShareSheet>();
    m_summary = std::make_shared<ShareSummary>(
        ShareSummary::Services{m_services.words, m_services.media, m_services.files, m_services.mainQueue}, m_items,
        nameOfMovie(m_services, m_items));
    m_closeButton = std::make_shared<Button>();
    m_closeButton->setGlyph("close");
    m_closeButton->setAccessibilityLabel(m_services.words.text("SHARE_CLOSE"));
    m_closeButton->addTarget(weak, closeSelector(), kTouchUpInside);
    m_summary->setTrailingInset(kCloseSize + kCloseMargin);
    m_separator = std::make_shared<SurfaceView>(SurfaceView::Style::Separator);
    m_list = std::make_shared<ShareListView>(m_services.words);
    view()->addSubview(m_summary);
    view()->addSubview(m_closeButton);
    view()->addSubview(m_list);
    view()->addSubview(m_separator);
    m_list->show(m_activities.activities(), weak, pickSelector(), cancelSelector());
    m_summary->load();
    m_services.provider.findActivities(m_items,
                                       [weak](const std::vector<std::shared_ptr<Activity>>& activities, bool isLast) {
                                           if (const auto self = weak.lock())
                                               self->addFound(activities, isLast);
                                       });
}

void ShareSheet::addFound(const std::vector<std::shared_ptr<Activity>>& activities, bool isLast)
{
    m_activities.add(activities);
    m_list->show(m_activities.activities(), weakSelf<ShareSheet>(), pickSelector(), cancelSelector());
    if (isLast)
        m_list->setLooking(false);
    contentSizeDidChange();
}

base::Size ShareSheet::contentSizeThatFits(base::Size room)
{
    assertHere();
    view();
    m_listHeight = m_list->wantedHeight();
    return {room.width, std::min(room.height, m_summary->heightThatFits(room.width) + m_listHeight)};
}

void ShareSheet::viewDidLayoutSubviews()
{
    assertHere();
    const base::Size size = view()->bounds().size;
    const auto itsWindow = window();
    const bool rightToLeft = itsWindow && itsWindow->isRightToLeft();
    const double hairline = itsWindow ? 1 / itsWindow->scale() : 1;
    const double top = std::min(size.height, m_summary->heightThatFits(size.width));
    m_summary->setFrame(base::Rect::make(0, 0, size.width, top));
    m_closeButton->setFrame(base::Rect::make(rightToLeft ? kCloseMargin : size.width - kCloseSize - kCloseMargin,
                                             kCloseMargin, kCloseSize, kCloseSize));
    m_list->setFrame(base::Rect::make(0, top, size.width, size.height - top));
    m_separator->setFrame(base::Rect::make(0, top, size.width, hairline));
}

void ShareSheet::presentationDidShow()
{
    assertHere();
    m_activities.freeze();
    m_list->freezeHeight(m_listHeight);
}

std::shared_ptr<View> ShareSheet::preferredFocusView()
{
    assertHere();
    return m_list && !m_list->rows().empty() ? m_list->rows().front()->row() : nullptr;
}

std::shared_ptr<ActivityRow> ShareSheet::runningRow() const
{
    return m_list->rowOf(*m_running);
}

void ShareSheet::rowPicked(std::shared_ptr<runtime::Object> row)
{
    assertHere();
    if (m_running || m_isClosing)
        return;
    for (const auto& each : m_list->rows())
        if (each->row() == row) {
            const auto keepAlive = shared_from_this();
            perform(std::shared_ptr(each->activity()));
            return;
        }
}

void ShareSheet::perform(const std::shared_ptr<Activity>& activity)
{
    m_running = m_performed = activity;
    const auto weak = weakSelf<ShareSheet>();
    const Activity* const raw = activity.get();
    activity->setEndHandler([weak, raw](const Activity::End& end) {
        if (const auto self = weak.lock())
            self->activityEnded(*raw, end);
    });
    activity->setProgressHandler([weak, raw](std::optional<double> progress) {
        if (const auto self = weak.lock())
            self->activityProgressed(*raw, progress);
    });
    m_list->setEnabled(false);
    activity->prepareWithActivityItems(m_items);
    if (m_running != activity)
        return;
    if (const auto controller = activity->activityViewController()) {
        m_activityController = controller;
        present(controller, true);
        return;
    }
    performInRow(activity);
}

void ShareSheet::performInRow(const std::shared_ptr<Activity>& activity)
{
    const auto row = runningRow();
    const auto itsWindow = window();
    const bool isSteeredByKeys = itsWindow && row && itsWindow->focusedView() == row->row();
    if (row) {
        row->showRunning();
        // Whoever picked it by a key can cancel it by one.
        view()->layoutIfNeeded();
        if (isSteeredByKeys)
            itsWindow->restoreFocus(row->cancelButton());
    }
    activity->performActivity();
}

void ShareSheet::activityProgressed(const Activity& activity, std::optional<double> progress) const
{
    if (m_running.get() != &activity || m_isClosing)
        return;
    if (const auto row = runningRow(); row && row->cancelButton()->isEnabled())
        row->showProgress(progress);
}

void ShareSheet::activityEnded(const Activity& activity, const Activity::End& end)
{
    // One that the user thought was given up may have been too quick: what the receiver has, it has.
    const bool isLate = !m_running && end.completed;
    if (m_performed.get() != &activity || (!m_running && !isLate))
        return;
    const auto ended = m_performed;
    if (m_services.activityEnded)
        m_services.activityEnded(activity, end);
    const bool closes = end.completed || m_isClosing;
    if (closes) {
        m_outcome = {ended->activityType(), end.completed, end.error};
        m_running.reset();
        close();
        return;
    }
    goBackToList();
    const auto controller = m_activityController.lock();
    const bool isControllerShown = controller && presentedViewController() == controller;
    const auto weak = weakSelf<ShareSheet>();
    const auto tell = [weak, ended, error = end.error] {
        const auto self = weak.lock();
        if (self && error)
            self->showError(*ended, error);
    };
    if (isControllerShown)
        dismiss(true, tell);
    else
        tell();
}

void ShareSheet::goBackToList()
{
    const auto row = runningRow();
    m_running.reset();
    const auto itsWindow = window();
    const bool isSteeredByKeys = itsWindow && row && itsWindow->focusedView() == row->cancelButton();
    m_list->setEnabled(true);
    if (!row)
        return;
    row->showIdle();
    if (isSteeredByKeys)
        itsWindow->restoreFocus(row->row());
}

} // namespace platform
