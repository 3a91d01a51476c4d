/// Puts the movie into the user's library of videos. Main queue only.
#pragma once

#include "base/Queue.h"
#include "platform/files/MessageCatalog.h"
#include "platform/photos/PhotoLibrary.h"
#include "platform/sharing/Activity.h"

#include <optional>
#include <string>

namespace platform {

class SaveToVideosActivity final : public Activity {
public:
    /// All of them outlive it.
    SaveToVideosActivity(const MessageCatalog& words, PhotoLibrary& library, base::MainQueue& mainQueue);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    std::string activityType() const override;
    std::string activityTitle() const override;
    std::string glyph() const override { return "videos"; }
    bool canPerformWithActivityItems(const ShareItems& items) const override;
    void prepareWithActivityItems(const ShareItems& items) override;
    /// Ends when the library has the movie, whole. It cannot be cancelled: a copy on one disk takes no time worth it.
    void performActivity() override;

    std::string receiver() const override { return here(m_receiver); }
    /// Where the library has put it, from whoever hears of that; before it ends.
    void setReceiver(std::string path) { here(m_receiver) = std::move(path); }

private:
    const MessageCatalog& m_words;
    PhotoLibrary& m_library;
    base::MainQueue& m_mainQueue;
    std::optional<base::Url> m_movie;
    std::string m_receiver;
};

} // namespace platform
