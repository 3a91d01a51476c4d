#include "linux/devices/DeviceActivity.h"

#include "linux/devices/DeviceName.h"

#include <filesystem>

namespace devices {

DeviceActivity::DeviceActivity(const sharing::Environment& environment, const Way& way, std::string_view name)
    : OutboxActivity(environment, sharing::Outbox::Use::Read), m_way(way), m_name(readableName(name))
{
    if (m_name.empty())
        m_name = environment.words.text("SHARE_DEVICE_UNNAMED");
}

void DeviceActivity::tellApart(int number)
{
    here(m_number) = number;
}

std::string DeviceActivity::activityTitle() const
{
    assertHere();
    if (!m_number)
        return m_name;
    const platform::MessageCatalog& words = environment().words;
    const std::string way = words.text(m_way.word);
    if (*m_number == 0)
        return words.text("SHARE_DEVICE_BY", {{"device", m_name}, {"way", way}});
    return words.text("SHARE_DEVICE_BY_NUMBERED",
                      {{"device", m_name}, {"way", way}, {"number", std::int64_t{*m_number}}});
}

void DeviceActivity::give()
{
    m_files.clear();
    for (std::size_t i = 0; i < OutboxActivity::files().size(); ++i) {
        const auto& kept = OutboxActivity::files()[i];
        std::error_code unknown;
        const auto size = std::filesystem::file_size(kept->path(), unknown);
        m_files.push_back({kept, originals()[i].name, unknown ? 0 : size});
    }
    send();
}

void DeviceActivity::fail(const char* key, const std::string& fileName, const std::string& why)
{
    const std::string way = environment().words.text(m_way.word);
    OutboxActivity::fail(base::Error::withMessage(base::Error::make("org.clipsa.devices", 1, why), key,
                                                  {{"device", m_name}, {"way", way}, {"name", fileName}}));
}

} // namespace devices
