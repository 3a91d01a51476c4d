// Sharing: what the store says of the app goes along with the movie, and what the user completes is noted.

#include "editor/VKVideoEditorViewController.h"

#include "base/Text.h"
#include "platform/sharing/ActivityTypes.h"
#include "platform/sharing/ShareSheet.h"
#include "runtime/Class.h"
#include "store/VKStoreManager.h"
#include "support/VKBundleExtensions.h"

#include <algorithm>

namespace {

/// Where it is installed, the video service's own application shares with it.
constexpr const char* kVideoServiceExtension = "com.youtube.ShareExtension";

/// Known at run time where the client library of the video service is.
constexpr const char* kVideoServiceClient = "YTCategoriesRequest";
constexpr const char* kVideoServiceActivity = "VKYouTubeActivity";
constexpr const char* kVideoServiceType = "VKPublishToYouTube";
constexpr std::ptrdiff_t kVideoServicePlace = 2; ///< behind mail and message

} // namespace

void VKVideoEditorViewController::shareAction()
{
    assertHere();
    m_platform.system.mainQueue.post([weak = weakSelf<VKVideoEditorViewController>()] {
        if (const auto self = weak.lock())
            self->share();
    });
}

void VKVideoEditorViewController::share()
{
    displayShareSheetWithVideoURL(videoURL());
    // The play item also while the movie is playing.
    if (isPadMode()) {
        platform::Toolbar::Items items{doneButton(), flexSpace(),   titleButton(), flexSpace(), playButton(),
                                       fixSpace(),   shareButton(), fixSpace(),    saveButton()};
        if (isIntroMode())
            std::erase(items, playButton());
        topToolBar()->setItems(std::move(items));
    } else {
        topToolBar()->setItems({doneButton(), flexSpace(), titleButton(), flexSpace(), saveButton()});
    }
}

void VKVideoEditorViewController::displayShareSheetWithVideoURL(const std::optional<base::Url>& url)
{
    assertHere();
    m_platform.system.log.message("displayShareSheetWithVideoURL");
    VKStoreManager::sharedManager()->loadItemDetailsForBundleIdentifier_completionHandler(
        {m_platform.store, m_platform.bundles, m_platform.system.mainQueue}, bundleIdentifier().value_or(""),
        [weak = weakSelf<VKVideoEditorViewController>(), url](const std::shared_ptr<VKStoreInfo>& info) {
            if (const auto self = weak.lock())
                self->presentShareSheet(url, *info);
        });
}

platform::ShareItems VKVideoEditorViewController::shareItems(const std::optional<base::Url>& url,
                                                             const VKStoreInfo& info) const
{
    platform::ShareItems items;
    if (overrideShareMessage()) {
        items.emplace_back(*overrideShareMessage());
    } else {
        items.emplace_back(shareText(info));
        items.emplace_back(info.itemURL().value_or("")); // also when it is empty
    }
    if (url)
        items.emplace_back(*url);
    if (fileAttachmentURL())
        items.emplace_back(*fileAttachmentURL());
    return items;
}

std::string VKVideoEditorViewController::shareText(const VKStoreInfo& info) const
{
    const std::string appName = info.appName().value_or("");
    const std::string author = info.author().value_or("");
    if (author.empty())
        return appName;
    const auto format =
        VKExtensions::_vkLocalizedStringFromFrameworkBundleWithKey(m_platform.bundles, "SHARE_TEXT_FORMAT");
    return format ? base::formatted(*format, {appName, author}) : appName;
}

void VKVideoEditorViewController::presentShareSheet(const std::optional<base::Url>& url, const VKStoreInfo& info)
{
    std::vector<std::string> order{platform::kActivityTypeMail, platform::kActivityTypeMessage,
                                   platform::kActivityTypeCopyToPasteboard, platform::kActivityTypePostToFacebook};
    std::vector<std::shared_ptr<platform::Activity>> extraActivities;
    if (const auto activity = videoServiceActivity()) {
        extraActivities.push_back(activity);
        order.insert(order.begin() + kVideoServicePlace, kVideoServiceType);
    }
    platform::Sharing& sharing = m_platform.sharing;
    const auto sheet = std::make_shared<platform::ShareSheet>(
        platform::ShareSheet::Services{
            m_platform.words, m_platform.media, m_platform.files, sharing.activities(), m_platform.system.mainQueue,
            [&sharing](const base::Url& movie) {
                const std::string name = sharing.nameOf(movie);
                return name.substr(0, name.rfind('.')); // people know what it is
            },
            [&sharing](const platform::Activity& activity, const platform::Activity::End& end) {
                sharing.activityEnded(activity, end);
            }},
        shareItems(url, info), extraActivities);
    sheet->setExcludedActivityTypes({platform::kActivityTypeCopyToPasteboard});
    if (!extraActivities.empty())
        sheet->setActivityTypeOrder(std::move(order));
    sheet->setCompletionHandler(
        [weak = weakSelf<VKVideoEditorViewController>(), &main = m_platform.system.mainQueue](
            const std::string& activityType, bool completed, const platform::ShareItems&, const base::ErrorRef&) {
            if (completed)
                main.post([weak, activityType] {
                    if (const auto self = weak.lock())
                        self->activityTypes()->push_back(activityType);
                });
            if (const auto self = weak.lock())
                self->setShareSheetUp(false);
        });
    if (isPadMode()) {
        sheet->setModalPresentationStyle(platform::ModalPresentationStyle::Popover);
        sheet->setPopoverSource(shareButton());
    }
    present(sheet, true, [weak = weakSelf<VKVideoEditorViewController>()] {
        if (const auto self = weak.lock())
            self->setShareSheetUp(true);
    });
}

/// Null where the video service's own application is there, and where its client library is not.
std::shared_ptr<platform::Activity> VKVideoEditorViewController::videoServiceActivity() const
{
    if (m_platform.bundles.bundleWithIdentifier(kVideoServiceExtension))
        return nullptr;
    if (!runtime::Class::named(kVideoServiceClient))
        return nullptr;
    const auto* const found = runtime::Class::named(kVideoServiceActivity);
    return found ? std::dynamic_pointer_cast<platform::Activity>(found->instantiate()) : nullptr;
}
