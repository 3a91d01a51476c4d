/// The six values that the host hands over. Any thread: loads write them from threads of their own.
#pragma once

#include "base/Url.h"
#include "platform/views/Color.h"

#include <mutex>
#include <optional>
#include <string>
#include <utility>

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

private:
    mutable std::mutex m_mutex;
    PayloadValues m_values;
};
