#include "linux/photos/LibraryName.h"

#include "base/Text.h"
#include "linux/posix/FileName.h"

#include <algorithm>
#include <array>
#include <ctime>
#include <glib.h>
#include <memory>
#include <utility>

namespace photos {

namespace {

/// Bytes. With a date, a number and an extension this stays below 143, the longest name in an encrypted home directory.
constexpr std::size_t kLongestAppName = 96;
constexpr std::size_t kLongestExtension = 5;

std::string localTime(base::Date date)
{
    const auto seconds = static_cast<std::time_t>(date.wholeSeconds());
    std::tm time = {};
    ::localtime_r(&seconds, &time);
    std::array<char, 64> text{};
    const std::size_t length = std::strftime(text.data(), text.size(), "%Y-%m-%d %H-%M-%S", &time);
    return {text.data(), length};
}

std::string extensionOf(std::string_view path)
{
    const std::string_view name = path.substr(path.rfind('/') + 1);
    const std::size_t dot = name.rfind('.');
    std::string extension(dot == std::string_view::npos || dot == 0 ? "" : name.substr(dot + 1));
    const bool isPlain = std::all_of(extension.begin(), extension.end(), [](char c) { return g_ascii_isalnum(c); });
    if (extension.empty() || extension.size() > kLongestExtension || !isPlain)
        return ".mp4";
    std::transform(extension.begin(), extension.end(), extension.begin(), base::lowercase);
    return "." + extension;
}

/// Recorders call their files like "Screencast from 2026-11-21 15-04-05", "2026-11-21_15-04-05" or
/// "rec-20261121-150405".
std::string withoutDate(std::string_view appName)
{
    static GRegex* const date =
        g_regex_new(R"([\s_.-]*(?<![A-Za-z0-9])(?:19|20)\d\d[-_.]?[01]\d[-_.]?[0-3]\d(?:\sat\s|[\s_.T-]*))"
                    R"([0-2]\d[-_.:]?[0-5]\d(?:[-_.:]?[0-5]\d)?(?:[-_.]\d{1,3})?(?:\s\(\d+\))?\s*$)",
                    G_REGEX_RAW, {}, nullptr);
    const std::string name(appName);
    GMatchInfo* raw = nullptr;
    const bool found = g_regex_match(date, name.c_str(), {}, &raw);
    const std::unique_ptr<GMatchInfo, decltype(&g_match_info_free)> match(raw, &g_match_info_free);
    int start = 0;
    return found && g_match_info_fetch_pos(raw, 0, &start, nullptr) ? name.substr(0, static_cast<std::size_t>(start))
                                                                    : name;
}

} // namespace

std::string LibraryName::numbered(int number) const
{
    return number == 1 ? stem + extension : stem + " (" + std::to_string(number) + ")" + extension;
}

LibraryName libraryName(std::string_view appName, base::Date date, std::string_view path)
{
    const std::string name = withoutDate(appName);
    const bool isOnlyDate = name.empty() && !appName.empty();
    return {(isOnlyDate ? "" : fileNameSafe(name) + " ") + localTime(date), extensionOf(path)};
}

std::string fileNameSafe(std::string_view text)
{
    return posix::fileNameSafe(text, kLongestAppName);
}

} // namespace photos
