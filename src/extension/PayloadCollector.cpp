#include "extension/PayloadCollector.h"

#include "extension/VKVideoEditorExtensionProtocols.h"

#include <string>
#include <utility>

namespace {

template <typename T> void keepAs(std::optional<T>& slot, const runtime::Value& item)
{
    if (const T* value = std::any_cast<T>(&item))
        slot = *value;
}

void keepAsPath(std::optional<base::Url>& slot, const runtime::Value& item)
{
    if (const auto* path = std::any_cast<std::string>(&item))
        slot = base::Url::fromPath(*path);
}

} // namespace

void PayloadCollector::collect(std::string_view title, const runtime::Value& item)
{
    std::unique_lock lock(m_mutex);
    keep(title, item);
    if (!m_values.hasAllRequired())
        return;
    // Told from where they are kept, two loads that end at once could be heard in the wrong order: the older values
    // would then replace the newer ones.
    m_untold.push_back(m_values);
    if (std::exchange(m_telling, true))
        return;
    while (!m_untold.empty()) {
        const auto next = std::exchange(m_untold, {});
        lock.unlock();
        for (const PayloadValues& values : next)
            m_tell(values);
        lock.lock();
    }
    m_telling = false;
}

bool PayloadCollector::hasAllRequired() const
{
    const std::lock_guard lock(m_mutex);
    return m_values.hasAllRequired();
}

void PayloadCollector::keep(std::string_view title, const runtime::Value& item)
{
    if (title == VKVideoEditorExtensionAppNameKey)
        keepAs(m_values.appName, item);
    else if (title == VKVideoEditorExtensionMoviePathKey)
        keepAsPath(m_values.movieURL, item);
    else if (title == VKVideoEditorExtensionBundleIdentifierKey)
        keepAs(m_values.bundleIdentifier, item);
    else if (title == VKVideoEditorExtensionFileAttachmentKey)
        keepAsPath(m_values.fileAttachmentURL, item);
    else if (title == VKVideoEditorExtensionOverrideShareMessageKey)
        keepAs(m_values.overrideShareMessage, item);
    else if (title == VKVideoEditorExtensionOverrideTintColorKey)
        keepAs(m_values.overrideTintColor, item);
}
