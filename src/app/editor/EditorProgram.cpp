#include "app/editor/EditorProgram.h"

#include "app/editor/NoticeScreen.h"
#include "app/editor/Script.h"
#include "app/editor/StartTrace.h"
#include "base/Environment.h"
#include "extension/VKVideoEditorExtensionContext.h"
#include "extension/VKVideoEditorExtensionViewController.h"
#include "linux/dbus/Chassis.h"
#include "linux/ffmpeg/CubebOutput.h"
#include "linux/xdg/Chassis.h"
#include "linux/xdg/InstalledResources.h"
#include "linux/xdg/MountTable.h"

#include <QGuiApplication>
#include <QScreen>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>

namespace app {

namespace {

/// Pictures for the strip stand back behind the player, whose seeks a finger waits for.
constexpr int kImageNiceness = 10;

constexpr std::int32_t kNoHomeButton = 2; ///< the capability service's answer on devices without one

constexpr base::Size kPhoneWindow{390, 760};   // points: a phone on a desktop
constexpr base::Size kDesktopWindow{960, 640}; // points

/// The extension as its declaration names it.
const platform::ExtensionDeclaration kDeclaration{"VKVideoEditorExtensionContext",
                                                  "VKVideoEditorExtensionViewController"};

/// Files say it at once; the service on the system bus may have to be started first, and is asked only then.
std::string chassis()
{
    if (const auto known = xdg::chassisFromMachineInfo())
        return *known;
    return dbus::chassis().value_or("desktop");
}

xdg::DeviceValues deviceValues(const EditorOptions& options)
{
    xdg::DeviceValues values = options.idiom ? xdg::DeviceValues{} : xdg::deviceValuesForChassis(chassis());
    if (options.idiom)
        values.idiom = options.idiom;
    if (options.hasHomeButton)
        values.hasHomeButton = *options.hasHomeButton;
    if (options.graphicsQuality)
        values.graphicsQuality = *options.graphicsQuality;
    return values;
}

base::Size firstWindowSize(const EditorOptions& options)
{
    const base::Size wanted = options.idiom == platform::InterfaceIdiom::Phone ? kPhoneWindow : kDesktopWindow;
    const QScreen* screen = QGuiApplication::primaryScreen();
    if (!screen)
        return wanted;
    const QSize room = screen->availableSize();
    return {std::min<double>(wanted.width, room.width()), std::min<double>(wanted.height, room.height())};
}

xdg::MountTable mounts(const EditorOptions& options)
{
    xdg::MountTable table;
    table.mount(xdg::kPrivateLibraryPrefix, options.deviceRoot);
    table.mount(xdg::kSystemLibraryPrefix, xdg::resourceDirectory() + "/System/Library");
    return table;
}

/// Where messages are kept by the journal they carry its levels.
base::StreamLog::Style logStyle()
{
    return base::environment("JOURNAL_STREAM").empty() ? base::StreamLog::Style::Plain
                                                       : base::StreamLog::Style::Journal;
}

} // namespace

EditorProgram::EditorProgram(const EditorOptions& options)
    : m_options(options), m_log(stderr, logStyle(), options.verbose), m_mainQueue(m_clock),
      m_loop(m_mainQueue), m_system{m_log, m_clock, m_mainQueue, m_backgroundQueue, m_defaultQueue},
      m_report(posix::FileDescriptor(options.report.value_or(-1))),
      m_window(std::make_shared<platform::Window>(m_mainQueue, firstWindowSize(options), 1.0)),
      m_device(deviceValues(options), [this] { return m_window->bounds().width(); }),
      m_images([this] { return m_window->scale(); }), m_files(m_system, mounts(options)),
      m_bundles(m_files, m_languages, xdg::BundlePlaces::ofUser()), m_words(m_bundles, xdg::wordsPath()),
      m_media(m_system, m_notifications,
              {[this](const std::string& path) { return m_files.resolvedPath(path); }, ffmpeg::cubebOutput(m_log),
               &m_works, kImageNiceness}),
      m_photos(libraryOptions(), m_log, m_works), m_store(m_log, storefront::Options::ofUser()),
      m_sharing(sharingOptions()), m_platform{m_system, m_notifications, m_device, *m_window,  m_images,
                                              m_files,  m_bundles,       m_words,  m_calendar, m_media,
                                              m_photos, m_store,         m_sharing},
      m_presenter(m_window, m_clock, m_words), m_connection(std::make_shared<dbus::ExtensionConnection>(m_mainQueue)),
      m_payload(m_mainQueue, [this] { openMovie(); }), m_busy(options.deviceRoot),
      m_workWatch(m_mainQueue, m_works,
                  {[this] {
                       learnAboutRecording();
                       m_busy.set();
                   },
                   [this] {
                       m_busy.clear();
                       if (m_leaving)
                           leaveWhenDone();
                   },
                   [this](std::optional<double> progress) { m_presenter.showWork(progress); },
                   [this] { m_presenter.hideWork(); }})
{
    m_window->setLog(m_log);
    m_window->setRightToLeft(m_words.isRightToLeft());
    // Declares the classes that the declaration names.
    VKVideoEditorExtensionContext::classObject();
    VKVideoEditorExtensionViewController::classObject();
}

EditorProgram::~EditorProgram()
{
    m_affinity.assertHere();
    // The queues outlive what their tasks use: what is still to be done, like emptying the store of temporary movies, is
    // done while all of that is there.
    m_extension = {};
    m_mainQueue.drain();
    m_backgroundQueue.finish();
    m_defaultQueue.finish();
    m_mainQueue.drain();
}

int EditorProgram::run()
{
    m_affinity.assertHere();
    markStart("platform");
    if (const auto started = start(); !started) {
        m_log.error(started.error()->description());
        return 4;
    }
    QGuiApplication::exec();
    // What was handed back on the way out goes while everything that it needs is there.
    m_mainQueue.drain();
    return 0;
}

base::Result<void> EditorProgram::start()
{
    if (auto connected = m_connection->connect(m_options.address); !connected)
        return connected;
    auto items = m_connection->inputItems();
    if (!items)
        return items.error();
    markStart("connected");

    m_extension = platform::instantiateExtension(kDeclaration);
    m_connection->setHostInterface(m_extension.context->hostInterface());
    m_extension.context->setUp(m_platform, m_payload.watched(std::move(items).value()), m_connection);
    m_connection->setDisconnectedHandler([this] { disconnected(); });
    m_connection->setSentHandler([this] { m_mainQueue.postAfter(kFarewellLimit, [this] { disconnected(); }); });

    if (!m_bundles.bundleWithPath(xdg::wordsPath()))
        m_log.error("there are no words at " + xdg::wordsPath() + "; install Clipsa again");
    m_presenter.setTitle("Clipsa");
    m_presenter.setCloseHandler([this] { closeRequested(); });
    m_presenter.setLiveBlur(m_device.graphicsQuality() != VKVideoOverlayButton::kGraphicsQualityWithoutBlur);
    m_presenter.setFirstPictureHandler([this] {
        m_pictureSeen = true;
        markStart("first-picture");
        m_store.prepare(); // there is time now, and none when Share is pressed
    });
    if (const std::string script = base::environment("CLIPSA_SCRIPT"); !script.empty())
        m_script = std::make_unique<Script>(*this, script);

    // Loads the view, which starts the loads of the payload.
    m_window->setRootViewController(m_extension.principal);
    m_payload.startedAll();
    m_mainQueue.postAfter(kPayloadLimit, [this] { waitForPayload(); });
    return {};
}

/// The extension would build an editor of nothing if it appeared now, whose buttons do what they say.
void EditorProgram::waitForPayload()
{
    if (m_shown || !m_extension.principal)
        return;
    showNotice(m_words.text("NOTICE_WAITING"));
    m_presenter.showWork(std::nullopt);
    if (m_script && m_script->beginsWithWaiting())
        m_script->start();
}

/// In place of the extension, which has not appeared then or disappears.
void EditorProgram::showNotice(const std::string& text)
{
    m_waiting = true;
    const bool hasHomeButton = m_device.integerAnswer(platform::kDeviceHomeButtonKey, 0) != kNoHomeButton;
    // The extension's view follows the window, as its editors are as large as it is.
    m_window->setRootViewController(std::make_shared<NoticeScreen>(
        m_words, text, hasHomeButton,
        NoticeScreen::Handlers{
            [this] { m_mainQueue.post([this] { closeRequested(); }); }, // not inside the tap on what goes then
            [view = m_extension.principal->view()](base::Rect bounds) { view->setFrame(bounds); }}));
    if (!m_window->isVisible())
        openWindow();
}

/// What is no movie gets no window whose Save would keep it. Most movies are open by now, or will be in a moment; the
/// window is made ready for the others while they are being opened.
void EditorProgram::openMovie()
{
    const auto current = editor();
    if (!current)
        return; // a value that is needed could not be loaded: the host is about to close us
    const auto asset = current->avAsset();
    if (!asset || !asset->url()) {
        show();
        return;
    }
    asset->whenLoaded([this, weak = std::weak_ptr(asset)] {
        const auto opened = weak.lock();
        if (opened && opened->error())
            refuse(*opened->error());
        else
            show();
    });
    m_mainQueue.postAfter(kOpeningLimit, [this] {
        if (!m_shown && !m_waiting && m_extension.principal)
            showNotice({});
    });
}

void EditorProgram::refuse(const base::Error& error)
{
    if (!m_extension.principal)
        return;
    m_report.add({dbus::MovieNote::Kind::Refused, {}, error.description()});
    if (!m_options.explain) {
        disconnected();
        return;
    }
    m_shown = true; // there is nothing else to be shown
    m_presenter.hideWork();
    showNotice(platform::wordsFor(error, m_words));
}

void EditorProgram::show()
{
    if (m_shown || !m_extension.principal)
        return;
    m_shown = true;
    markStart("payload");
    learnAboutRecording();
    if (std::exchange(m_waiting, false)) {
        m_presenter.hideWork();
        m_window->setRootViewController(m_extension.principal);
    } else {
        openWindow();
    }
    if (m_script && !m_script->hasStarted())
        m_script->start();
}

void EditorProgram::openWindow()
{
    if (m_device.userInterfaceIdiom() == platform::InterfaceIdiom::Phone && !m_options.idiom
        && QGuiApplication::platformName() != "offscreen")
        m_presenter.showFullScreen();
    else
        m_presenter.show();
    markStart("window");
}

std::shared_ptr<VKVideoEditorViewController> EditorProgram::editor() const
{
    m_affinity.assertHere();
    const auto principal = std::dynamic_pointer_cast<VKVideoEditorExtensionViewController>(m_extension.principal);
    return principal ? principal->videoEditorViewController() : nullptr;
}

void EditorProgram::closeRequested()
{
    // As the close button: the host is told what was done, and then closes us. Before the recording is there nothing
    // has been done, not even looked at.
    const auto current = editor();
    if (!current || m_waiting) {
        disconnected();
        return;
    }
    if (std::exchange(m_closing, true))
        return;
    // What stands above the editor is closed first: it holds up the editor's end.
    current->closePresented([this] {
        // Later: what was shared until now is noted first.
        m_mainQueue.post([this] {
            m_closing = false;
            if (const auto closed = editor())
                closed->doneAction();
        });
    });
}

void EditorProgram::disconnected()
{
    if (!m_extension.principal)
        return;
    m_script.reset();
    cancelTrims();
    m_presenter.hide();
    m_window->setVisible(false);
    // The editors go with the controller, and empty the temporary store as they go.
    m_window->setRootViewController(nullptr);
    m_extension = {};
    m_connection->flush();
    leaveWhenDone();
}

/// Nobody is left to see what they would make. Before the views go: with them the controller lets go of its editor.
void EditorProgram::cancelTrims() const
{
    for (const auto& child : m_extension.principal->childViewControllers())
        if (const auto each = std::dynamic_pointer_cast<VKVideoEditorViewController>(child);
            each && each->isExporting())
            each->exportSession()->cancelExport();
}

/// A save that is under way holds its editor, and the movie with it. Its end calls again.
void EditorProgram::leaveWhenDone()
{
    m_leaving = true;
    if (!m_workWatch.isWorking())
        QGuiApplication::exit(); // quit() would ask the window, which never closes by itself
}

} // namespace app
