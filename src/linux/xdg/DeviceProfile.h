/// What this device is and can do: values that are known at start, from its chassis and the command line.
/// Main queue only.
#pragma once

#include "base/Affinity.h"
#include "platform/device/Device.h"

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace xdg {

/// Windows narrower than this, in points, are laid out as phones.
inline constexpr double kNarrowWindowWidth = 600;

struct DeviceValues {
    /// Nothing: as the window is, at the time of the question.
    std::optional<platform::InterfaceIdiom> idiom;
    /// The default gives compact bars; nothing on a Linux machine tells of the other kind.
    bool hasHomeButton = true;
    /// 10 spares the device live blurs; any other value is as good as this one.
    std::int32_t graphicsQuality = 100;
    /// Answers to the Boolean questions; no to any other.
    std::map<std::string, bool, std::less<>> booleans = {{"not-zorvane", true}};
};

/// What a machine of that chassis is like, in hostnamed's words: "handset" is a phone, "tablet" and "convertible" are
/// pads, and whatever has windows of any size ("desktop", "laptop", "server", unknown words) goes by their width.
DeviceValues deviceValuesForChassis(std::string_view chassis);

/// "phone" or "pad", as `--device` says it; nothing for other words.
std::optional<platform::InterfaceIdiom> idiomNamed(std::string_view name);

class DeviceProfile final : public platform::Device {
public:
    /// `windowWidth` gives points; empty where there is no window, which is as good as a wide one.
    explicit DeviceProfile(DeviceValues values, std::function<double()> windowWidth = {});

    std::optional<platform::InterfaceIdiom> userInterfaceIdiom() const override;
    /// Answers the question about the home button only: 2 for none, 1 for one.
    std::int32_t integerAnswer(std::string_view key, std::int32_t fallback) const override;
    bool booleanAnswer(std::string_view key) const override;
    std::int32_t graphicsQuality() const override
    {
        m_affinity.assertHere();
        return m_values.graphicsQuality;
    }

private:
    const DeviceValues m_values;
    const std::function<double()> m_windowWidth;
    base::Affinity m_affinity;
};

} // namespace xdg
