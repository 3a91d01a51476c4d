/// What the device is and can do. Answers come from a device profile; main queue only.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

namespace platform {

/// The capability service's question about the home button: an answer of 2 means that there is none. Opaque, and stored
/// as it is.
inline constexpr std::string_view kDeviceHomeButtonKey = "9qW1yXn0bTUd5c3pEJhM2g";

enum class InterfaceIdiom { Phone, Pad };

class Device {
public:
    virtual ~Device() = default;

    /// Nothing when this device cannot answer the question.
    virtual std::optional<InterfaceIdiom> userInterfaceIdiom() const = 0;
    /// The capability service's answer under `key`, or `fallback` when it has none.
    virtual std::int32_t integerAnswer(std::string_view key, std::int32_t fallback) const = 0;
    virtual bool booleanAnswer(std::string_view key) const = 0;
    /// 10 stands for a device that is better spared live blurs.
    virtual std::int32_t graphicsQuality() const = 0;
};

} // namespace platform
