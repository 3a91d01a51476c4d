#include "support/VKBundleExtensions.h"

#include "base/Once.h"
#include "base/SharedValue.h"

#include <utility>

namespace {

constexpr const char* kFrameworkPath = "/System/Library/Frameworks/Velkor.framework";
constexpr const char* kTable = "Localizable";
constexpr const char* kTableType = "strings";
constexpr const char* kPhotoClass = "GPPhotoTileViewController";
constexpr const char* kPhotoTables[] = {"Pictora-Device", "Pictora", "Pictora-Cascada", "Pictora-GM"};

} // namespace

namespace VKExtensions {

platform::BundleRef _vkFrameworkBundle(platform::Bundles& receiver)
{
    static base::Once<platform::BundleRef> bundle;
    return bundle.get([&receiver] { return receiver.bundleWithPath(kFrameworkPath); });
}

platform::BundleRef localizedBundle(platform::Bundles& receiver)
{
    const platform::BundleRef framework = _vkFrameworkBundle(receiver);
    if (!framework)
        return nullptr;
    const platform::Languages& languages = receiver.languages();
    const auto serving = languages.preferredLocalizations(framework->localizations(), languages.preferredLanguages());
    if (serving.empty())
        return nullptr;
    return receiver.bundleWithPath(framework->resourcePath() + "/" + serving.front() + ".lproj");
}

platform::BundleRef fallbackBundle(platform::Bundles& receiver)
{
    const platform::BundleRef framework = _vkFrameworkBundle(receiver);
    if (!framework)
        return nullptr;
    const std::string preferred = receiver.languages().preferredLanguages().front();
    const auto table = framework->pathForResource(kTable, kTableType, preferred.substr(0, preferred.find('-')));
    if (!table)
        return nullptr;
    return receiver.bundleWithPath(table->substr(0, table->rfind('/')));
}

std::optional<std::string> _vkLocalizedStringFromFrameworkBundleWithKey(platform::Bundles& receiver,
                                                                        const std::string& key)
{
    for (const auto& find : {localizedBundle, fallbackBundle, _vkFrameworkBundle})
        if (const platform::BundleRef bundle = find(receiver))
            return bundle->localizedString(key, std::nullopt, kTable);
    return std::nullopt;
}

std::optional<std::string> _vkLocalizedAppNameFromBundleID(platform::Bundles& receiver, const std::string& identifier)
{
    const platform::BundleRef bundle = receiver.bundleWithIdentifier(identifier);
    if (!bundle)
        return std::nullopt;
    return _vkLocalizedAppName(*bundle);
}

std::string baseIdentifier(std::string_view identifier)
{
    const std::size_t dot = identifier.rfind('.');
    return std::string(identifier.substr(0, dot == std::string_view::npos ? 0 : dot));
}

platform::BundleRef bundleWithPID(platform::Bundles& receiver, std::int32_t process)
{
    const auto program = receiver.executablePathOfProcess(process);
    if (!program)
        return nullptr;
    const auto url = receiver.bundleURLForExecutableURL(base::Url::fromPath(*program));
    return url ? receiver.bundleWithURL(*url) : nullptr;
}

std::string _vkLocalizedAppName(const platform::Bundle& receiver)
{
    const platform::StringsTable localized = receiver.localizedInfoDictionary();
    if (const auto name = localized.find(platform::kBundleDisplayNameKey); name != localized.end())
        return name->second;
    const platform::StringsTable info = receiver.infoDictionary();
    for (const char* key : {platform::kBundleDisplayNameKey, platform::kBundleNameKey})
        if (const auto name = info.find(key); name != info.end())
            return name->second;
    return {};
}

} // namespace VKExtensions

platform::BundleRef VKPictoraFrameworkBundle(platform::Bundles& bundles)
{
    static base::SharedValue<platform::BundleRef> kept;
    if (const platform::BundleRef known = kept.value())
        return known;
    platform::BundleRef found = bundles.bundleForClassNamed(kPhotoClass);
    if (found)
        kept.setValue(found);
    return found;
}

std::optional<std::string> VKLocalizedFrameworkString(platform::Bundles& bundles, const std::string& key)
{
    const platform::BundleRef bundle = VKPictoraFrameworkBundle(bundles);
    if (!bundle)
        return std::nullopt;
    std::string text = key;
    for (const char* table : kPhotoTables) {
        text = bundle->localizedString(key, "", table);
        if (text != key)
            break;
    }
    return text;
}
