/// The program's own words in English, as they stand in its table: places are filled with what stands there, numbers without
/// any form. Any thread.
#pragma once

#include "platform/files/MessageCatalog.h"
#include "platform/files/StringsTable.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"

#include <string>
#include <vector>

namespace tests {

class EnglishWords final : public platform::MessageCatalog {
public:
    bool rightToLeft = false;
    /// As in a language whose words are 40 % longer.
    bool stretched = false;

    std::string text(std::string_view key) const override
    {
        const auto found = m_table.find(key);
        if (found == m_table.end())
            return std::string(key);
        return stretched ? found->second + std::string((found->second.size() * 2 + 4) / 5, 'n') : found->second;
    }
    std::string text(std::string_view key, const std::vector<platform::MessageArgument>& arguments) const override
    {
        std::string message = text(key);
        for (const platform::MessageArgument& each : arguments)
            if (const std::size_t at = message.find(std::string("{") + each.name); at != std::string::npos)
                message.replace(at, message.find('}', at) - at + 1, written(each.value));
        return message;
    }
    std::string duration(double seconds, int decimals) const override
    {
        const std::string number = std::to_string(seconds);
        const std::size_t dot = number.find('.');
        return number.substr(0, decimals == 0 ? dot : dot + 1 + static_cast<std::size_t>(decimals)) + " s";
    }
    std::string clock(double seconds) const override
    {
        const auto whole = static_cast<long>(seconds);
        const std::string rest = std::to_string(whole % 60);
        return std::to_string(whole / 60) + (rest.size() < 2 ? ":0" : ":") + rest;
    }
    std::string fileSize(std::int64_t bytes) const override { return std::to_string(bytes) + " bytes"; }
    std::string list(const std::vector<std::string>& names) const override
    {
        std::string all;
        for (const std::string& name : names)
            all += (all.empty() ? "" : ", ") + name;
        return all;
    }
    bool isRightToLeft() const override { return rightToLeft; }

private:
    static std::string written(const std::variant<std::string, std::int64_t, double>& value)
    {
        if (const auto* text = std::get_if<std::string>(&value))
            return *text;
        const auto* whole = std::get_if<std::int64_t>(&value);
        return whole ? std::to_string(*whole) : std::to_string(std::get<double>(value));
    }

    const platform::StringsTable m_table =
        platform::parseStrings(
            PrivateDirectory::read(sourceFile("resources/bundles/Clipsa.bundle/en.lproj/Localizable.strings")),
            "the English table")
            .table;
};

} // namespace tests
