#include "linux/devices/DeviceActivity.h"

#include "linux/devices/DeviceName.h"

#include <cerrno>
#include <filesystem>

namespace devices {

DeviceActivity::DeviceActivity(const sharing::Environment& environment, const Way& way, std::string_view name)
    : m_environment(environment), m_way(way), m_name(readableName(name))
{
    if (m_name.empty())
        m_name = environment.words.text("SHARE_DEVICE_UNNAMED");
}

DeviceActivity::~DeviceActivity()
{
    assertHere();
    if (m_wanted)
        *m_wanted = false;
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
    const platform::MessageCatalog& words = m_environment.words;
    const std::string way = words.text(m_way.word);
    if (*m_number == 0)
        return words.text("SHARE_DEVICE_BY", {{"device", m_name}, {"way", way}});
    return words.text("SHARE_DEVICE_BY_NUMBERED",
                      {{"device", m_name}, {"way", way}, {"number", std::int64_t{*m_number}}});
}

bool DeviceActivity::canPerformWithActivityItems(const platform::ShareItems& items) const
{
    assertHere();
    return !platform::filesOf(items).empty();
}

void DeviceActivity::prepareWithActivityItems(const platform::ShareItems& items)
{
    assertHere();
    m_toSend.clear();
    for (const base::Url& file : platform::filesOf(items))
        m_toSend.emplace_back(m_environment.files.resolvedPath(file.path()), m_environment.nameOf(file));
}

void DeviceActivity::performActivity()
{
    assertHere();
    m_work = m_environment.works.begin();
    m_wanted = std::make_shared<std::atomic<bool>>(true);
    noteProgress(std::nullopt);
    m_environment.system.defaultQueue.post([weak = weakSelf<DeviceActivity>(), toSend = m_toSend, wanted = m_wanted,
                                            outbox = m_environment.outbox, tells = tellsCopying(),
                                            &main = m_environment.system.mainQueue]() mutable {
        double told = 0;
        const auto putAll = [&]() -> Prepared {
            std::vector<File> files;
            if (!*wanted)
                return base::Error::fromErrno(ECANCELED, "preparing it");
            for (const auto& [path, name] : toSend) {
                const auto goOn = [&](std::uint64_t copied, std::uint64_t total) {
                    const double part = total > 0 ? static_cast<double>(copied) / static_cast<double>(total) : 0;
                    const double progress =
                        (static_cast<double>(files.size()) + part) / static_cast<double>(toSend.size());
                    constexpr double kWorthTelling = 0.01;
                    if (tells && progress >= told + kWorthTelling) {
                        told = progress;
                        main.post([weak, progress] {
                            if (const auto self = weak.lock())
                                self->setProgress(progress);
                        });
                    }
                    return wanted->load();
                };
                auto kept = outbox.put(path, name, goOn);
                if (!kept)
                    return kept.error();
                std::error_code unknown;
                const auto size = std::filesystem::file_size(kept.value()->path(), unknown);
                files.push_back({std::move(kept).value(), name, unknown ? 0 : size});
            }
            return files;
        };
        main.post([weak, files = putAll()]() mutable {
            // Locked here: a strong reference on the worker could be the last one and end us on the wrong thread.
            if (const auto self = weak.lock())
                self->prepared(std::move(files));
        });
    });
}

void DeviceActivity::prepared(Prepared files)
{
    if (!isUnderWay())
        return;
    if (!files) {
        fail(files.error());
        return;
    }
    m_files = std::move(files).value();
    send();
}

void DeviceActivity::cancel()
{
    assertHere();
    if (!isUnderWay())
        return;
    *m_wanted = false;
    stop();
    const auto work = std::move(m_work);
    activityDidFinish(false);
}

void DeviceActivity::setProgress(double progress) const
{
    if (!isUnderWay())
        return;
    m_work->setProgress(progress);
    noteProgress(progress);
}

void DeviceActivity::complete()
{
    stop();
    // Kept until those who wait for us have been told: the process may end with it.
    const auto work = std::move(m_work);
    activityDidFinish(true);
}

void DeviceActivity::fail(const char* key, const std::string& fileName, const std::string& why)
{
    const std::string way = m_environment.words.text(m_way.word);
    fail(base::Error::withMessage(base::Error::make("org.clipsa.devices", 1, why), key,
                                  {{"device", m_name}, {"way", way}, {"name", fileName}}));
}

void DeviceActivity::fail(base::ErrorRef error)
{
    m_environment.system.log.error("cannot send to “" + m_name + "”: " + error->description());
    stop();
    const auto work = std::move(m_work);
    activityDidFail(std::move(error));
}

} // namespace devices
