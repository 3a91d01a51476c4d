#include "app/editor/DisplayWatch.h"

#include <QByteArray>
#include <QString>

#include <cstdio>
#include <cstdlib>
#include <string_view>

namespace app {

namespace {

void take(QtMsgType type, const QMessageLogContext& context, const QString& message)
{
    // Its own words on the way to a failure; those of one plugin do not matter when the next one works.
    if (type != QtFatalMsg && std::string_view(context.category ? context.category : "").starts_with("qt.qpa"))
        return;
    if (type != QtFatalMsg) {
        std::fprintf(stderr, "%s\n", message.toUtf8().constData());
        return;
    }
    const QByteArray wayland = qgetenv("WAYLAND_DISPLAY");
    const QByteArray display = wayland.isEmpty() ? qgetenv("DISPLAY") : wayland;
    if (!display.isEmpty())
        std::fprintf(stderr,
                     "clipsa-editor: no window can be opened on the display %s; is it running, and are you "
                     "allowed to use it?\n",
                     display.constData());
    else
        std::fputs("clipsa-editor: there is no display to open a window on; start Clipsa in a graphical session\n",
                   stderr);
    std::_Exit(kNoDisplay);
}

} // namespace

DisplayWatch::DisplayWatch() : m_former(qInstallMessageHandler(&take)) {}

DisplayWatch::~DisplayWatch()
{
    qInstallMessageHandler(m_former);
}

} // namespace app
