#include "app/editor/Drawing.h"

#include <QQuickWindow>

#include <algorithm>
#include <string>
#include <string_view>

namespace app {

namespace {

bool anyBeginsWith(const std::filesystem::path& directory, std::initializer_list<std::string_view> beginnings)
{
    std::error_code error;
    for (auto entry = std::filesystem::directory_iterator(directory, error); !error && entry != end(entry);
         entry.increment(error)) {
        const std::string name = entry->path().filename().string();
        if (std::any_of(beginnings.begin(), beginnings.end(), [&](auto start) { return name.starts_with(start); }))
            return true;
    }
    return false;
}

} // namespace

bool hasGraphicsDevice(const std::filesystem::path& devices)
{
    // The kernel's own drivers, then those that makers of graphics cards and of telephones bring along.
    return anyBeginsWith(devices / "dri", {"renderD"})
           || anyBeginsWith(devices, {"nvidia", "nvhost", "nvgpu", "kgsl", "mali", "pvr", "galcore", "dxg"});
}

void chooseDrawing()
{
    if (qEnvironmentVariableIsEmpty("QT_QUICK_BACKEND") && qEnvironmentVariableIsEmpty("QSG_RHI_BACKEND")
        && !hasGraphicsDevice())
        QQuickWindow::setSceneGraphBackend(QStringLiteral("software"));
}

} // namespace app
