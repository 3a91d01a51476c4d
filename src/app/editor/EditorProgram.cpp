#include "app/editor/EditorProgram.h"

#include "app/editor/MovieThumbnail.h"
#include "app/editor/Script.h"
#include "app/editor/StartTrace.h"
#include "extension/VKVideoEditorExtensionContext.h"
#include "extension/VKVideoEditorExtensionViewController.h"
#include "linux/dbus/Chassis.h"
#include "linux/ffmpeg/CubebOutput.h"
#include "linux/xdg/Chassis.h"
#include "linux/xdg/MountTable.h"
#include "support/VKFileManagerExtensions.h"

#include <QGuiApplication>
#include <QScreen>

#include <algorithm>
#include <cstdlib>
#include <optional>
#include <string>

namespace app {

namespace {

/// Pictures for the strip stand back behind the player, whose seeks a finger waits for.
constexpr int kImageNiceness = 10;

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
    // Where the programs are installed, their resources are beside them.
    table.mount(xdg::kSystemLibraryPrefix,
                QCoreApplication::applicationDirPath().toStdString() + "/../share/clipsa/System/Library");
    return table;
}

/// Where messages are kept by the journal they carry its levels.
base::StreamLog::Style logStyle()
{
    return std::getenv("JOURNAL_STREAM") ? base::StreamLog::Style::Journal : base::StreamLog::Style::Plain;
}

} // namespace

EditorProgram::EditorProgram(const EditorOptions& options)
    : m_options(options), m_log(stderr, logStyle(), options.verbose), m_mainQueue(m_clock),
      m_loop(m_mainQueue), m_system{m_log, m_clock, m_mainQueue, m_backgroundQueue, m_defaultQueue},
      m_window(std::make_shared<platform::Window>(m_mainQueue, firstWindowSize(options), 1.0)),
      m_device(deviceValues(options), [this] { return m_window->bounds().width(); }),
      m_images([this] { return m_window->scale(); }), m_files(m_system, mounts(options)),
      m_media(m_system, m_notifications,
              {[this](const std::string& path) { return m_files.resolvedPath(path); }, ffmpeg::cubebOutput(m_log),
               &m_works, kImageNiceness}),
      m_photos(libraryOptions(), m_log, m_works), m_platform{m_system, m_notifications, m_device, *m_window, m_images,
                                                             m_files,  m_calendar,      m_media,  m_photos},
      m_presenter(m_window, m_clock), m_connection(std::make_shared<dbus::ExtensionConnection>(m_mainQueue)),
      m_payload(m_mainQueue, [this] { show(); }), m_busy(options.deviceRoot),
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
    // Declares the classes that the declaration names.
    VKVideoEditorExtensionContext::classObject();
    VKVideoEditorExtensionViewController::classObject();
}

EditorProgram::~EditorProgram()
{
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

    m_presenter.setTitle("Clipsa");
    m_presenter.setCloseHandler([this] { closeRequested(); });
    m_presenter.setLiveBlur(m_device.graphicsQuality() != VKVideoOverlayButton::kGraphicsQualityWithoutBlur);
    m_presenter.setFirstPictureHandler([this] {
        m_pictureSeen = true;
        markStart("first-picture");
    });
    if (const char* script = std::getenv("CLIPSA_SCRIPT"))
        m_script = std::make_unique<Script>(*this, script);

    // Loads the view, which starts the loads of the payload.
    m_window->setRootViewController(m_extension.principal);
    m_payload.startedAll();
    m_mainQueue.postAfter(kPayloadLimit, [this] { show(); });
    return {};
}

void EditorProgram::show()
{
    if (m_shown || !m_extension.principal)
        return;
    m_shown = true;
    markStart("payload");
    learnAboutRecording();
    if (m_device.userInterfaceIdiom() == platform::InterfaceIdiom::Phone && !m_options.idiom
        && QGuiApplication::platformName() != "offscreen")
        m_presenter.showFullScreen();
    else
        m_presenter.show();
    markStart("window");
    if (m_script)
        m_script->start();
}

std::shared_ptr<VKVideoEditorViewController> EditorProgram::editor() const
{
    const auto principal = std::dynamic_pointer_cast<VKVideoEditorExtensionViewController>(m_extension.principal);
    return principal ? principal->videoEditorViewController() : nullptr;
}

void EditorProgram::closeRequested()
{
    // As the close button: the host is told what was done, and then closes us.
    if (const auto current = editor())
        current->doneAction();
    else
        disconnected();
}

void EditorProgram::disconnected()
{
    if (!m_extension.principal)
        return;
    m_script.reset();
    m_presenter.hide();
    m_window->setVisible(false);
    // The editors go with the controller, and empty the temporary store as they go.
    if (const auto current = editor(); current && current->isExporting())
        current->exportSession()->cancelExport(); // nobody is left to see what a trim would make
    m_window->setRootViewController(nullptr);
    m_extension = {};
    m_connection->flush();
    leaveWhenDone();
}

/// A save that is under way holds its editor, and the movie with it. Its end calls again.
void EditorProgram::leaveWhenDone()
{
    m_leaving = true;
    if (!m_workWatch.isWorking())
        QGuiApplication::exit(); // quit() would ask the window, which never closes by itself
}

/// The library names the movie after the app and the date of the recording as it came.
void EditorProgram::learnAboutRecording()
{
    const auto current = editor();
    if (!current || !current->originalVideoURL())
        return;
    const auto created = VKExtensions::_srGetCreationDateForFile(m_files, *current->originalVideoURL());
    if (created)
        m_recording.setValue({current->applicationName().value_or(""), created});
}

photos::LibraryOptions EditorProgram::libraryOptions()
{
    return {photos::UserDirectories::ofUser(),
            [this](const std::string& path) { return m_files.resolvedPath(path); },
            [this](const std::string&) { return m_recording.value(); },
            [this](const std::string& path, int side) { return movieThumbnail(m_mainQueue, m_media, path, side); },
            {}};
}

} // namespace app
