// The extension's process. It is started by its host, gets the payload through a private connection, and ends with it.

#include "app/editor/DisplayWatch.h"
#include "app/editor/Drawing.h"
#include "app/editor/EditorOptions.h"
#include "app/editor/EditorProgram.h"
#include "app/editor/StartTrace.h"
#include "linux/dbus/ExtensionConnection.h"

#include <QGuiApplication>

#include <cstdio>
#include <fcntl.h>
#include <optional>

int main(int argc, char* argv[])
{
    app::markStart("main");
    const auto options = app::EditorOptions::parse({argv + 1, argv + argc});
    if (!options) {
        std::fprintf(stderr, "clipsa-editor: %s\n", options.error()->description().c_str());
        return 2;
    }
    // Keeps our directory alive as long as we live, but not as long as programs that we start.
    fcntl(dbus::kEditorLockDescriptor, F_SETFD, FD_CLOEXEC);
    if (options.value().report)
        fcntl(*options.value().report, F_SETFD, FD_CLOEXEC);
    app::chooseDrawing();
    std::optional<app::DisplayWatch> watch(std::in_place);
    QGuiApplication application(argc, argv);
    watch.reset();
    app::markStart("application");
    QGuiApplication::setApplicationName("Clipsa");
    QGuiApplication::setDesktopFileName("org.clipsa.Clipsa");
    QGuiApplication::setQuitOnLastWindowClosed(false);
    return app::EditorProgram(options.value()).run();
}
