#include "app/editor/EditorProgram.h"

#include "app/editor/Script.h"
#include "app/editor/StartTrace.h"
#include "extension/VKVideoEditorExtensionContext.h"
#include "extension/VKVideoEditorExtensionViewController.h"
#include "linux/dbus/Chassis.h"
#include "linux/ffmpeg/CubebOutput.h"
#include "linux/xdg/Chassis.h"
#include "linux/xdg/MountTable.h"

#include <QGuiApplication>
#include <QScreen>

#include <algorithm>
#include <cstdlib>
#include <string>

namespace app {

namespace {

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
              {[this](const std::string& path) { return m_files.resolvedPath(path); }, ffmpeg::cubebOutput(m_log)}),
      m_platform{m_system, m_notifications, m_device, *m_window, m_images, m_files, m_calendar, m_media},
      m_presenter(m_window, m_clock), m_connection(std::make_shared<dbus::ExtensionConnection>(m_mainQueue)),
      m_payload(m_mainQueue, [this] { show(); })
{
    // Declares the classes that the declaration names.
    VKVideoEditorExtensionContext::classObject();
    VKVideoEditorExtensionViewController::classObject();
}

EditorProgram::~EditorProgram() = default;

int EditorProgram::run()
{
    markStart("platform");
    if (const auto started = start(); !started) {
        m_log.error(started.error()->description());
        return 4;
    }
    QGuiApplication::exec();
    return m_exitStatus;
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
    m_window->setRootViewController(nullptr);
    m_extension = {};
    m_connection->flush();
    QGuiApplication::exit(m_exitStatus); // quit() would ask the window, which never closes by itself
}

} // namespace app
