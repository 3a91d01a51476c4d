/// Bundles in memory. Any thread, while nothing is added or removed.
#pragma once

#include "platform/files/Bundles.h"
#include "support/FakeLanguages.h"

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace tests {

class FakeBundle final : public platform::Bundle {
public:
    explicit FakeBundle(std::string path) : m_path(std::move(path)) {}

    std::string identifier;
    std::vector<std::string> languages;
    platform::StringsTable info, localizedInfo;
    std::set<std::string> resources; ///< "en/Table.strings"
    std::map<std::string, platform::StringsTable> tables;
    mutable std::vector<std::string> asked; ///< "Table KEY"

    const std::string& bundlePath() const override { return m_path; }
    std::string bundleIdentifier() const override { return identifier; }
    std::string resourcePath() const override { return m_path; }
    std::vector<std::string> localizations() const override { return languages; }
    platform::StringsTable infoDictionary() const override { return info; }
    platform::StringsTable localizedInfoDictionary() const override { return localizedInfo; }
    std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                               const std::string& localization) const override
    {
        if (!resources.contains(localization + "/" + name + "." + type))
            return std::nullopt;
        return m_path + "/" + localization + ".lproj/" + name + "." + type;
    }
    std::string localizedString(std::string_view key, const std::optional<std::string>& value,
                                const std::string& table) const override
    {
        asked.push_back(table + " " + std::string(key));
        if (const auto found = tables.find(table); found != tables.end())
            if (const auto text = found->second.find(key); text != found->second.end())
                return text->second;
        return value && !value->empty() ? *value : std::string(key);
    }

private:
    const std::string m_path;
};

class FakeBundles final : public platform::Bundles {
public:
    /// One that can be told to find nothing.
    struct Spoken final : platform::Languages {
        std::vector<std::string> preferred = {"en"};
        bool servesNobody = false;

        std::vector<std::string> preferredLanguages() const override { return preferred; }
        std::vector<std::string> preferredLocalizations(const std::vector<std::string>& localizations,
                                                        const std::vector<std::string>& preferences) const override
        {
            return servesNobody ? std::vector<std::string>()
                                : FakeLanguages().preferredLocalizations(localizations, preferences);
        }
    };

    Spoken spoken;
    std::map<std::string, std::string, std::less<>> classes; ///< paths of bundles
    std::map<std::int32_t, std::string> programs;            ///< of processes
    std::map<std::string, std::string> bundlesOfPrograms;    ///< paths of bundles
    std::atomic<int> opened = 0;                             ///< how often one was asked for by its path

    std::shared_ptr<FakeBundle> add(const std::string& path)
    {
        return m_bundles[path] = std::make_shared<FakeBundle>(path);
    }
    void remove(const std::string& path) { m_bundles.erase(path); }
    std::shared_ptr<FakeBundle> at(const std::string& path) const { return m_bundles.at(path); }

    const platform::Languages& languages() const override { return spoken; }
    platform::BundleRef bundleWithPath(const std::string& path) override
    {
        ++opened;
        const auto found = m_bundles.find(path);
        return found == m_bundles.end() ? nullptr : found->second;
    }
    platform::BundleRef bundleWithURL(const base::Url& url) override { return bundleWithPath(url.path()); }
    platform::BundleRef bundleWithIdentifier(const std::string& identifier) override
    {
        for (const auto& [path, bundle] : m_bundles)
            if (bundle->identifier == identifier)
                return bundle;
        return nullptr;
    }
    platform::BundleRef bundleForClassNamed(std::string_view name) override
    {
        const auto found = classes.find(name);
        return found == classes.end() ? nullptr : bundleWithPath(found->second);
    }
    std::optional<std::string> executablePathOfProcess(std::int32_t process) override
    {
        const auto found = programs.find(process);
        return found == programs.end() ? std::nullopt : std::optional(found->second);
    }
    std::optional<base::Url> bundleURLForExecutableURL(const base::Url& executable) override
    {
        const auto found = bundlesOfPrograms.find(executable.path());
        return found == bundlesOfPrograms.end() ? std::nullopt : std::optional(base::Url::fromPath(found->second));
    }

private:
    std::map<std::string, std::shared_ptr<FakeBundle>> m_bundles;
};

} // namespace tests
