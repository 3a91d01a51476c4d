/// The commands that need the media engine run in a program of their own, `clipsa-media`: `clipsa` itself starts faster
/// without the engine's libraries.
#pragma once

namespace host {

/// Becomes `clipsa-media`, which lies beside our own program or in ../libexec/clipsa, with the same words. Comes back only
/// when that fails, having printed why, with the exit status.
int startMediaProgram(char* const words[]);

} // namespace host
