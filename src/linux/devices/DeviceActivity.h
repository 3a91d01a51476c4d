/// Sends files to one nearby device: what all ways to a device have in common. Main queue only.
///
/// The text is not sent: a device has no place for it beside the files.
#pragma once

#include "linux/sharing/OutboxActivity.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace devices {

/// How a device is reached.
struct Way {
    const char* activityType;
    const char* word; ///< what people call it: a key
    const char* glyph;
};

class DeviceActivity : public sharing::OutboxActivity {
public:
    /// `name` is what the device says; whatever it is, it becomes one that can be shown.
    DeviceActivity(const sharing::Environment& environment, const Way& way, std::string_view name);

    const std::string& deviceName() const { return here(m_name); }
    const Way& way() const { return here(m_way); }
    /// Another device has the same name: the title tells by which way this one is reached and, from 1, which one of those
    /// by that way it is; 0 where there is only one.
    void tellApart(int number);

    std::string activityType() const override { return here(m_way).activityType; }
    std::string activityTitle() const override;
    std::string glyph() const override { return here(m_way).glyph; }
    std::string receiver() const override { return here(m_name); }

protected:
    struct File {
        std::shared_ptr<const sharing::Outbox::File> kept;
        std::string name; ///< as the user knows it
        std::uint64_t size = 0;

        const std::string& path() const { return kept->path(); }
    };

    const std::vector<File>& files() const { return m_files; }

    /// The files are ready. Ends, at some time, with one of the ends below.
    virtual void send() = 0;
    /// `key` says what people have to do, with places for the device, the way and the file's name; `why` is for the log.
    void fail(const char* key, const std::string& fileName, const std::string& why);

private:
    void give() final;

    const Way& m_way;
    std::string m_name;
    std::optional<int> m_number;
    std::vector<File> m_files;
};

} // namespace devices
