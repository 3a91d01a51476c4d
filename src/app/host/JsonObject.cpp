#include "app/host/JsonObject.h"

#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdio>

namespace host {

namespace {

/// The bytes of the character at `at`; 0 when they are not UTF-8.
std::size_t lengthOf(std::string_view text, std::size_t at)
{
    const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(i < text.size() ? text[i] : 0); };
    const unsigned char first = byte(at);
    const std::size_t length = first < 0x80                     ? 1
                               : first >= 0xC2 && first <= 0xDF ? 2
                               : (first & 0xF0) == 0xE0         ? 3
                               : first >= 0xF0 && first <= 0xF4 ? 4
                                                                : 0;
    for (std::size_t i = 1; i < length; ++i)
        if ((byte(at + i) & 0xC0) != 0x80)
            return 0;
    const unsigned char second = byte(at + 1);
    const bool isWrong = (first == 0xE0 && second < 0xA0) || (first == 0xED && second > 0x9F)
                         || (first == 0xF0 && second < 0x90) || (first == 0xF4 && second > 0x8F);
    return isWrong ? 0 : length;
}

std::string quoted(std::string_view text)
{
    std::string result = "\"";
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t length = lengthOf(text, at);
        const char first = text[at];
        if (length == 0) {
            result += "\uFFFD";
        } else if (first == '"' || first == '\\') {
            result += {'\\', first};
        } else if (static_cast<unsigned char>(first) < 0x20) {
            char escape[8];
            std::snprintf(escape, sizeof escape, "\\u%04x", static_cast<unsigned>(first));
            result += escape;
        } else {
            result += text.substr(at, length);
        }
        at += length > 0 ? length : 1;
    }
    return result + "\"";
}

} // namespace

JsonObject& JsonObject::add(std::string_view name, std::string_view text)
{
    return addRaw(name, quoted(text));
}

JsonObject& JsonObject::addUnlessEmpty(std::string_view name, std::string_view text)
{
    return text.empty() ? *this : add(name, text);
}

JsonObject& JsonObject::add(std::string_view name, double number)
{
    if (!std::isfinite(number))
        return addRaw(name, "null");
    char text[32];
    const auto result = std::to_chars(text, text + sizeof text, std::round(number * 1e6) / 1e6);
    return addRaw(name, {text, static_cast<std::size_t>(result.ptr - text)});
}

JsonObject& JsonObject::addList(std::string_view name, const std::vector<std::string>& objects)
{
    std::string list;
    for (const std::string& each : objects)
        list += (list.empty() ? "" : ",") + each;
    return addRaw(name, "[" + list + "]");
}

JsonObject& JsonObject::addRaw(std::string_view name, std::string_view value)
{
    m_members += m_members.empty() ? "" : ",";
    m_members += quoted(name) + ":";
    m_members += value;
    return *this;
}

} // namespace host
