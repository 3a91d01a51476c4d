/// What the libraries' errors mean, in the words of whoever uses the program. Any thread.
#pragma once

#include <string>

namespace ffmpeg {

/// Completes "it cannot be opened: "; begins in lower case and has no full stop.
std::string textOf(int avError);

/// A length for reading: "0.04 s", "2.5 s", "22:12" minutes, "1:22:12" hours.
std::string lengthInWords(double seconds);

} // namespace ffmpeg
