#include "platform/sharing/SaveToVideosActivity.h"

#include "platform/sharing/ActivityTypes.h"

namespace platform {

SaveToVideosActivity::SaveToVideosActivity(const MessageCatalog& words, PhotoLibrary& library,
                                           base::MainQueue& mainQueue)
    : m_words(words), m_library(library), m_mainQueue(mainQueue)
{
}

const runtime::Class& SaveToVideosActivity::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<SaveToVideosActivity>("SaveToVideosActivity", &Activity::classObject()).build();
    return instance;
}

const runtime::Class& SaveToVideosActivity::isa() const
{
    return classObject();
}

std::string SaveToVideosActivity::activityType() const
{
    assertHere();
    return kActivityTypeSaveToCameraRoll;
}

std::string SaveToVideosActivity::activityTitle() const
{
    assertHere();
    return m_words.text("SHARE_SAVE_TO_VIDEOS");
}

bool SaveToVideosActivity::canPerformWithActivityItems(const ShareItems& items) const
{
    assertHere();
    return !filesOf(items).empty();
}

void SaveToVideosActivity::prepareWithActivityItems(const ShareItems& items)
{
    assertHere();
    const auto files = filesOf(items);
    m_movie = files.empty() ? std::nullopt : std::optional(files.front());
}

void SaveToVideosActivity::performActivity()
{
    assertHere();
    const auto ask = [movie = m_movie](PhotoLibraryChange& change) { change.createAssetFromVideoAtFileURL(movie); };
    const auto done = [weak = weakSelf<SaveToVideosActivity>(), &main = m_mainQueue](bool success,
                                                                                     const base::ErrorRef& error) {
        // Locked on the main queue: the library's worker must not hold the last reference.
        main.post([weak, success, error] {
            const auto self = weak.lock();
            if (!self)
                return;
            if (success)
                self->activityDidFinish(true);
            else
                self->activityDidFail(error);
        });
    };
    m_library.performChanges(ask, done);
}

} // namespace platform
