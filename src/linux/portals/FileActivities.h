/// What the desktop can do with a movie by its portal, each an entry of the share sheet. Main queue only.
#pragma once

#include "linux/portals/PortalActivity.h"
#include "platform/sharing/ActivityTypes.h"

namespace portals {

/// A mail with the movie, and what goes along with it, attached; the text is its body. Who it goes to, and whether it goes,
/// is said in the composer: it is completed when that has taken it all.
class MailActivity final : public PortalActivity {
public:
    MailActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal)
        : PortalActivity(environment, std::move(portal), sharing::Outbox::Use::Read, "SHARE_MAIL_REFUSED")
    {
    }
    std::string activityType() const override { return platform::kActivityTypeMail; }
    std::string activityTitle() const override { return environment().words.text("SHARE_MAIL"); }
    std::string glyph() const override { return "mail"; }

protected:
    void give() override;
};

/// The user chooses an application, which gets a movie that it may change: nobody else has its bytes.
class OpenWithActivity final : public PortalActivity {
public:
    OpenWithActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal)
        : PortalActivity(environment, std::move(portal), sharing::Outbox::Use::Change, "SHARE_OPEN_WITH_REFUSED")
    {
    }
    std::string activityType() const override { return platform::kActivityTypeOpenWith; }
    std::string activityTitle() const override { return environment().words.text("SHARE_OPEN_WITH"); }
    std::string glyph() const override { return "open-with"; }

protected:
    bool takesOnlyTheMovie() const override { return true; }
    void give() override;
};

/// A copy where the user wants it, under the name that the user chooses; the chooser has asked whether what is there may be
/// replaced. It is completed when the copy is whole, and else there is none.
class SaveACopyActivity final : public PortalActivity {
public:
    /// The chooser begins in `folder`, or where it likes.
    SaveACopyActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal, std::string folder)
        : PortalActivity(environment, std::move(portal), sharing::Outbox::Use::Read, "SHARE_SAVE_A_COPY_REFUSED"),
          m_folder(std::move(folder))
    {
    }
    std::string activityType() const override { return platform::kActivityTypeSaveACopy; }
    std::string activityTitle() const override { return environment().words.text("SHARE_SAVE_A_COPY"); }
    std::string glyph() const override { return "save-as"; }
    /// The copy's path.
    std::string receiver() const override { return here(m_path); }

protected:
    bool takesOnlyTheMovie() const override { return true; }
    bool needsOutbox() const override { return false; }
    void give() override;
    void done(const QVariantMap& results) override;

private:
    std::string m_folder;
    std::shared_ptr<const posix::FileDescriptor> m_movie; ///< held from the tap on: its file may go meanwhile
    std::string m_path;
};

/// Shows the movie in the file manager: the user's own file where it is one. One of the editor's goes with it: then it is
/// one in the outbox, which can be dragged to where it is wanted.
class ShowInFolderActivity final : public PortalActivity {
public:
    /// By the portal, or by the file manager's own interface.
    enum class Way { Portal, FileManager };

    ShowInFolderActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal, Way way);

    std::string activityType() const override { return platform::kActivityTypeShowInFolder; }
    std::string activityTitle() const override { return environment().words.text("SHARE_SHOW_IN_FOLDER"); }
    std::string glyph() const override { return "folder"; }

    void prepareWithActivityItems(const platform::ShareItems& items) override;

protected:
    bool takesOnlyTheMovie() const override { return true; }
    bool needsOutbox() const override { return m_ownFile.empty(); }
    void give() override;
    void stop() override;

private:
    void showInFileManager(const std::string& path);

    const std::shared_ptr<Portal> m_portal;
    const Way m_way;
    std::string m_ownFile; ///< the user's; empty when it is one of the editor's
    bus::Calls m_calls;
};

} // namespace portals
