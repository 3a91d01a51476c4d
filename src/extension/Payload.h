/// The six values that the host hands over. Any thread: loads write them from threads of their own.
#pragma once

#include "base/Url.h"
#include "platform/views/Color.h"
#include "runtime/Value.h"

#include <mutex>
#include <optional>
#include <string>
#include <string_view>

struct PayloadValues {
    std::optional<std::string> bundleIdentifier;
    std::optional<std::string> appName;
    std::optional<base::Url> movieURL;
    std::optional<base::Url> fileAttachmentURL;
    std::optional<std::string> overrideShareMessage;
    std::optional<platform::Color> overrideTintColor;

    bool hasAllRequired() const { return appName && movieURL && bundleIdentifier; }
};

/// A place for the values that outlives whoever asked for them.
class Payload {
public:
    PayloadValues values() const;
    void setValues(PayloadValues values);
    template <typename T> void set(std::optional<T> PayloadValues::*member, std::optional<T> value)
    {
        const std::lock_guard lock(m_mutex);
        m_values.*member = std::move(value);
    }

    /// Keeps `item` as the value that `title` names, and gives what there is then. A title that names none, and an item
    /// of a kind that the value cannot be, change nothing.
    PayloadValues store(std::string_view title, const runtime::Value& item);

private:
    mutable std::mutex m_mutex;
    PayloadValues m_values;
};
