// What the libraries leak that encode, and we cannot mend: LeakSanitizer shall look at ours.

/// The sanitizer looks for this name, from a library of its own.
// NOLINTNEXTLINE(bugprone-reserved-identifier)
extern "C" [[gnu::visibility("default")]] const char* __lsan_default_suppressions();

extern "C" const char* __lsan_default_suppressions()
{
    return "leak:libx265.so";
}
