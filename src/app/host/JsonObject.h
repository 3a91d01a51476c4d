/// Puts a JSON object together, member by member, for commands that load no library for it. A value.
#pragma once

#include <concepts>
#include <string>
#include <string_view>
#include <vector>

namespace host {

class JsonObject {
public:
    /// `text` is UTF-8; bytes that are not become U+FFFD.
    JsonObject& add(std::string_view name, std::string_view text);
    JsonObject& addUnlessEmpty(std::string_view name, std::string_view text);
    /// What is not finite becomes null.
    JsonObject& add(std::string_view name, double number);
    template <std::integral Number> JsonObject& add(std::string_view name, Number number)
    {
        return addRaw(name, std::to_string(number));
    }
    JsonObject& addFlag(std::string_view name, bool flag) { return addRaw(name, flag ? "true" : "false"); }
    /// `objects` are the texts of others.
    JsonObject& addList(std::string_view name, const std::vector<std::string>& objects);
    JsonObject& addTexts(std::string_view name, std::vector<std::string> texts);

    std::string text() const { return "{" + m_members + "}"; }

private:
    JsonObject& addRaw(std::string_view name, std::string_view value);

    std::string m_members;
};

} // namespace host
