#include "app/host/Payload.h"

#include <utility>

namespace host {

namespace {

dbus::HostItem itemOf(std::string title, std::string text)
{
    return {std::move(title), {dbus::HostAttachment::of(std::move(text), platform::kTextType)}};
}

dbus::HostItem itemOf(std::string title, std::shared_ptr<Promise> promise)
{
    dbus::HostAttachment attachment{
        {platform::kGenericDataType, platform::kTextType},
        [promise = std::move(promise)](dbus::LoadedItem answer) { promise->whenKept(std::move(answer)); }};
    return {std::move(title), {std::move(attachment)}};
}

} // namespace

void Promise::keep(base::Result<runtime::Value> value)
{
    std::vector<dbus::LoadedItem> waiting;
    {
        const std::lock_guard lock(m_mutex);
        m_value = value;
        waiting.swap(m_waiting);
    }
    for (const dbus::LoadedItem& answer : waiting)
        answer(value);
}

void Promise::whenKept(dbus::LoadedItem answer)
{
    std::optional<base::Result<runtime::Value>> value;
    {
        const std::lock_guard lock(m_mutex);
        value = m_value;
        if (!value)
            m_waiting.push_back(answer);
    }
    if (value)
        answer(*value);
}

std::vector<dbus::HostItem> payloadItems(const dbus::EditRequest& request, std::shared_ptr<Promise> movie,
                                         std::shared_ptr<Promise> attachment)
{
    // The titles are agreed between host and extension, letter by letter.
    std::vector<dbus::HostItem> items;
    if (attachment)
        items.push_back(itemOf("VKVideoEditorExtensionFileAttachmentKey", std::move(attachment)));
    if (request.message)
        items.push_back(itemOf("VKVideoEditorExtensionOverrideShareMessageKey", *request.message));
    if (request.tint)
        items.push_back({"VKVideoEditorExtensionOverrideTintColorKey",
                         {dbus::HostAttachment::of(*request.tint, platform::kColorType)}});
    items.push_back(itemOf("VKVideoEditorExtensionAppNameKey", request.appName));
    items.push_back(itemOf("VKVideoEditorExtensionBundleIdentifierKey", request.bundleIdentifier));
    items.push_back(itemOf("VKVideoEditorExtensionMovieURLKey", std::move(movie)));
    return items;
}

} // namespace host
