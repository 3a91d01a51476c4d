/// What the libraries' errors mean, in the words of whoever uses the program. Any thread.
#pragma once

#include "base/Error.h"

#include <string>

namespace ffmpeg {

/// Completes "it cannot be opened: "; begins in lower case and has no full stop.
std::string textOf(int avError);

/// Why a movie cannot be opened, for people: a key of the program's table.
const char* messageKeyOf(int avError);

/// The error of a movie called `name` that cannot be opened; `why` completes "it cannot be opened: ". Its message is that of
/// `why`, if it has one, else what its code means.
base::ErrorRef notAMovie(const std::string& name, const base::ErrorRef& why);

/// A length for reading: "0.04 s", "2.5 s", "22:12" minutes, "1:22:12" hours.
std::string lengthInWords(double seconds);

} // namespace ffmpeg
