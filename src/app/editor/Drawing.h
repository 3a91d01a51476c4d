/// How the window is drawn: through OpenGL where there is a graphics device, without it elsewhere.
///
/// On a processor OpenGL is only an emulation that is loaded and compiled first, which takes longer than all else of the
/// start. Remote sessions, virtual machines and containers are like that.
#pragma once

#include <filesystem>

namespace app {

/// Whether anything in `devices`, the directory of device files, could draw.
bool hasGraphicsDevice(const std::filesystem::path& devices = "/dev");

/// Before the first window. Does nothing when the environment says how Qt is to draw.
void chooseDrawing();

} // namespace app
