#include "extension/Payload.h"

#include "extension/VKVideoEditorExtensionProtocols.h"

#include <utility>

namespace {

template <typename T> void keep(std::optional<T>& slot, const runtime::Value& item)
{
    if (const T* value = std::any_cast<T>(&item))
        slot = *value;
}

void keepPath(std::optional<base::Url>& slot, const runtime::Value& item)
{
    if (const auto* path = std::any_cast<std::string>(&item))
        slot = base::Url::fromPath(*path);
}

} // namespace

PayloadValues Payload::values() const
{
    const std::lock_guard lock(m_mutex);
    return m_values;
}

void Payload::setValues(PayloadValues values)
{
    const std::lock_guard lock(m_mutex);
    m_values = std::move(values);
}

PayloadValues Payload::store(std::string_view title, const runtime::Value& item)
{
    const std::lock_guard lock(m_mutex);
    if (title == VKVideoEditorExtensionAppNameKey)
        keep(m_values.appName, item);
    else if (title == VKVideoEditorExtensionMoviePathKey)
        keepPath(m_values.movieURL, item);
    else if (title == VKVideoEditorExtensionBundleIdentifierKey)
        keep(m_values.bundleIdentifier, item);
    else if (title == VKVideoEditorExtensionFileAttachmentKey)
        keepPath(m_values.fileAttachmentURL, item);
    else if (title == VKVideoEditorExtensionOverrideShareMessageKey)
        keep(m_values.overrideShareMessage, item);
    else if (title == VKVideoEditorExtensionOverrideTintColorKey)
        keep(m_values.overrideTintColor, item);
    return m_values;
}
