/// Languages that serve whoever prefers exactly them, or what stands before their first "-". Any thread, while nothing is
/// changed.
#pragma once

#include "platform/files/Languages.h"

#include <algorithm>
#include <string>
#include <vector>

namespace tests {

class FakeLanguages final : public platform::Languages {
public:
    std::vector<std::string> preferred = {"en"};

    std::vector<std::string> preferredLanguages() const override { return preferred; }
    std::vector<std::string> preferredLocalizations(const std::vector<std::string>& localizations,
                                                    const std::vector<std::string>& preferences) const override
    {
        std::vector<std::string> serving;
        for (const std::string& preference : preferences)
            for (const std::string& each : {preference, preference.substr(0, preference.find('-'))})
                if (std::find(localizations.begin(), localizations.end(), each) != localizations.end()
                    && std::find(serving.begin(), serving.end(), each) == serving.end())
                    serving.push_back(each);
        return serving;
    }
};

} // namespace tests
