#include "app/host/RequestText.h"

#include "base/Text.h"
#include "linux/dbus/EditRequest.h"
#include "linux/dbus/Protocol.h"

#include <algorithm>
#include <cstddef>

namespace host {

namespace {

constexpr std::size_t kLongestExtension = 16; // bytes, with the dot: longer ones are none

bool isControl(char character)
{
    return static_cast<unsigned char>(character) < 0x20 || character == 0x7F;
}

/// Copies characters as long as they fit into `limit` bytes; `one` gives what stands for a character.
template <typename Replace> std::string rewritten(std::string_view text, std::size_t limit, Replace&& replace)
{
    std::string result;
    while (!text.empty()) {
        const std::size_t length = base::characterLength(text);
        const std::string_view piece = length == 0 ? std::string_view("_") : replace(text.substr(0, length));
        if (result.size() + piece.size() > limit)
            break;
        result += piece;
        text.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return result;
}

} // namespace

base::Result<void> checkText(std::string_view text, const std::string& what)
{
    if (text.size() > dbus::kMaximumTextSize)
        return base::Error::make(dbus::kBadInputDomain, dbus::kTooLarge, what + " is longer than 1 MiB; shorten it");
    for (std::string_view rest = text; !rest.empty();) {
        const std::size_t length = base::characterLength(rest);
        if (length == 0 || rest.front() == '\0')
            return base::Error::make(dbus::kBadInputDomain, dbus::kBadArgument, what + " is not UTF-8 text");
        rest.remove_prefix(length);
    }
    return {};
}

std::string safeFileName(std::string_view name, std::string_view fallback)
{
    name.remove_prefix(name.rfind('/') + 1);
    // What does not fit goes from the stem: the extension says what kind of file it is.
    const std::size_t dot = name.rfind('.');
    const bool hasExtension = dot != std::string_view::npos && name.size() - dot <= kLongestExtension;
    const auto plain = [](std::string_view character) {
        return isControl(character.front()) ? std::string_view("_") : character;
    };
    const std::string extension = hasExtension ? rewritten(name.substr(dot), kLongestExtension, plain) : "";
    std::string safe = rewritten(hasExtension ? name.substr(0, dot) : name, 255 - extension.size(), plain) + extension;
    return safe.empty() || safe == "." || safe == ".." ? std::string(fallback) : safe;
}

std::string safeAppName(std::string_view name)
{
    return rewritten(name, 200, [](std::string_view character) -> std::string_view {
        if (character == "/")
            return "\u2044";
        return isControl(character.front()) ? " " : character;
    });
}

std::string withoutExtension(std::string_view fileName)
{
    const std::size_t dot = fileName.rfind('.');
    return std::string(dot == std::string_view::npos || dot == 0 ? fileName : fileName.substr(0, dot));
}

} // namespace host
