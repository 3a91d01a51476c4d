#include "app/host/JsonObject.h"

#include "base/Text.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdio>

namespace host {

namespace {

std::string escaped(char character)
{
    char escape[8];
    std::snprintf(escape, sizeof escape, "\\u%04x", static_cast<unsigned>(static_cast<unsigned char>(character)));
    return escape;
}

std::string quoted(std::string_view text)
{
    std::string result = "\"";
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t length = base::characterLength(text.substr(at));
        const char first = text[at];
        if (length == 0) {
            result += "\uFFFD";
        } else if (first == '"' || first == '\\') {
            result += {'\\', first};
        } else if (static_cast<unsigned char>(first) < 0x20 || first == 0x7F) {
            result += escaped(first);
        } else if (length == 2 && first == '\xC2' && static_cast<unsigned char>(text[at + 1]) < 0xA0) {
            result += escaped(text[at + 1]); // U+0080 to U+009F, which terminals obey
        } else {
            result += text.substr(at, length);
        }
        at += std::max<std::size_t>(length, 1);
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

JsonObject& JsonObject::addTexts(std::string_view name, std::vector<std::string> texts)
{
    for (std::string& text : texts)
        text = quoted(text);
    return addList(name, texts);
}

JsonObject& JsonObject::addRaw(std::string_view name, std::string_view value)
{
    m_members += m_members.empty() ? "" : ",";
    m_members += quoted(name) + ":";
    m_members += value;
    return *this;
}

} // namespace host
