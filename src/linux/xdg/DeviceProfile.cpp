#include "linux/xdg/DeviceProfile.h"

#include <utility>

namespace xdg {

using platform::InterfaceIdiom;

DeviceValues deviceValuesForChassis(std::string_view chassis)
{
    DeviceValues values;
    if (chassis == "handset")
        values.idiom = InterfaceIdiom::Phone;
    else if (chassis == "tablet" || chassis == "convertible")
        values.idiom = InterfaceIdiom::Pad;
    return values;
}

std::optional<InterfaceIdiom> idiomNamed(std::string_view name)
{
    if (name == "phone")
        return InterfaceIdiom::Phone;
    if (name == "pad")
        return InterfaceIdiom::Pad;
    return std::nullopt;
}

DeviceProfile::DeviceProfile(DeviceValues values, std::function<double()> windowWidth)
    : m_values(std::move(values)), m_windowWidth(std::move(windowWidth))
{
}

std::optional<InterfaceIdiom> DeviceProfile::userInterfaceIdiom() const
{
    m_affinity.assertHere();
    if (m_values.idiom)
        return m_values.idiom;
    const bool isNarrow = m_windowWidth && m_windowWidth() < kNarrowWindowWidth;
    return isNarrow ? InterfaceIdiom::Phone : InterfaceIdiom::Pad;
}

std::int32_t DeviceProfile::integerAnswer(std::string_view key, std::int32_t fallback) const
{
    m_affinity.assertHere();
    if (key != platform::kDeviceHomeButtonKey)
        return fallback;
    return m_values.hasHomeButton ? 1 : 2;
}

bool DeviceProfile::booleanAnswer(std::string_view key) const
{
    m_affinity.assertHere();
    const auto answer = m_values.booleans.find(key);
    return answer != m_values.booleans.end() && answer->second;
}

} // namespace xdg
