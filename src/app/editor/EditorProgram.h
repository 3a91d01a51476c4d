/// The editor process: makes the platform on Linux, starts the extension in it, and ends with its host. GUI thread.
///
/// From a connection to a host it takes the payload; the extension appears once that has been loaded, and its movie has
/// been opened. What is no movie is refused. When the host closes the connection, or dies, the extension disappears and
/// run() returns; a save that is under way then is finished first, without a window.
#pragma once

#include "app/editor/EditorOptions.h"
#include "app/editor/PayloadWatch.h"
#include "app/editor/ScriptClock.h"
#include "app/editor/WorkWatch.h"
#include "app/sharing/ShareServices.h"
#include "base/Affinity.h"
#include "base/SharedValue.h"
#include "base/WorkList.h"
#include "linux/dbus/BusyMark.h"
#include "linux/dbus/EditorReport.h"
#include "linux/dbus/ExtensionConnection.h"
#include "linux/ffmpeg/FFmpegMediaFramework.h"
#include "linux/icu/Calendar.h"
#include "linux/icu/Languages.h"
#include "linux/icu/MessageCatalog.h"
#include "linux/loop/MainLoop.h"
#include "linux/photos/VideoLibrary.h"
#include "linux/qt/Presenter.h"
#include "linux/qt/SvgImageCatalog.h"
#include "linux/storefront/AppStreamStore.h"
#include "linux/xdg/Bundles.h"
#include "linux/xdg/DeviceProfile.h"
#include "linux/xdg/FileManager.h"
#include "platform/hosting/ExtensionContext.h"

#include <memory>

class VKVideoEditorViewController;

namespace app {

class Script;

class EditorProgram {
public:
    /// A host that has not handed over its payload by then gets a window that says so, and waits for it.
    static constexpr base::Instant kPayloadLimit = std::chrono::seconds(1);
    /// A host that does not close the connection in that time, once it has been told that the user has finished, hangs:
    /// the window closes without it.
    static constexpr base::Instant kFarewellLimit = std::chrono::seconds(3);

    /// What is no movie is known by then, as a rule; a movie that takes longer to open gets its window meanwhile.
    static constexpr base::Instant kOpeningLimit = std::chrono::milliseconds(40);

    explicit EditorProgram(const EditorOptions& options);
    ~EditorProgram();

    /// Until the host is done with us; gives the process's exit status.
    int run();

    const base::System& system() const
    {
        m_affinity.assertHere();
        return m_system;
    }
    ScriptClock& clock()
    {
        m_affinity.assertHere();
        return m_clock;
    }
    platform::Window& window()
    {
        m_affinity.assertHere();
        return *m_window;
    }
    const platform::MessageCatalog& words() const
    {
        m_affinity.assertHere();
        return m_words;
    }
    qtui::Presenter& presenter()
    {
        m_affinity.assertHere();
        return m_presenter;
    }
    /// Whether some of a movie has been on the screen.
    bool hasShownPicture() const
    {
        m_affinity.assertHere();
        return m_pictureSeen;
    }
    /// Null before the payload has come, and after the end.
    std::shared_ptr<VKVideoEditorViewController> editor() const;

private:
    base::Result<void> start();
    void waitForPayload();
    void showNotice(const std::string& text);
    void openMovie();
    void refuse(const base::Error& error);
    void show();
    void openWindow();
    void closeRequested();
    void disconnected();
    void cancelTrims() const;
    void leaveWhenDone();
    photos::LibraryOptions libraryOptions();
    ShareServices::Options sharingOptions();
    std::string nameOf(const base::Url& file) const;
    void reportShared(const platform::Activity& activity, const platform::Activity::End& end);
    void learnAboutRecording();

    base::Affinity m_affinity;
    EditorOptions m_options;
    ScriptClock m_clock;
    base::StreamLog m_log;
    base::MainQueue m_mainQueue;
    loop::MainLoop m_loop;
    // They end before the main queue that they post to, and before the loop that it wakes.
    base::WorkerQueue m_backgroundQueue;
    base::WorkerQueue m_defaultQueue;
    base::System m_system;

    base::WorkList m_works;
    base::SharedValue<photos::Recording> m_recording; ///< what the library calls it
    dbus::EditorReport m_report;
    runtime::NotificationCenter m_notifications;
    std::shared_ptr<platform::Window> m_window;
    xdg::DeviceProfile m_device;
    qtui::SvgImageCatalog m_images;
    xdg::FileManager m_files;
    intl::Languages m_languages;
    xdg::Bundles m_bundles;
    intl::MessageCatalog m_words;
    intl::Calendar m_calendar;
    ffmpeg::FFmpegMediaFramework m_media;
    photos::VideoLibrary m_photos;
    storefront::AppStreamStore m_store;
    ShareServices m_sharing;
    platform::Platform m_platform;
    qtui::Presenter m_presenter;

    std::shared_ptr<dbus::ExtensionConnection> m_connection;
    platform::Extension m_extension;
    PayloadWatch m_payload;
    dbus::BusyMark m_busy;
    WorkWatch m_workWatch;
    std::unique_ptr<Script> m_script;
    bool m_waiting = false; ///< the window is open, but not on the extension
    bool m_shown = false;
    bool m_closing = false; ///< the window was asked to, and what stands above the editor goes
    bool m_leaving = false;
    bool m_pictureSeen = false;
};

} // namespace app
