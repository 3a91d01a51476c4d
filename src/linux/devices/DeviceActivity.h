/// Sends files to one nearby device: what all ways to a device have in common. Main queue only.
///
/// The files are put into the outbox on a worker first, under the names that their receiver is to see, and stay there for
/// whoever reads them after we have gone. The text is not sent: a device has no place for it beside the files. It keeps
/// the process alive until its end; whoever lets go of it before gives it up.
#pragma once

#include "linux/sharing/Environment.h"
#include "platform/sharing/Activity.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace devices {

/// How a device is reached.
struct Way {
    const char* activityType;
    const char* word; ///< what people call it: a key
    const char* glyph;
};

class DeviceActivity : public platform::Activity {
public:
    /// `name` is what the device says; whatever it is, it becomes one that can be shown.
    DeviceActivity(const sharing::Environment& environment, const Way& way, std::string_view name);
    ~DeviceActivity() override;

    const std::string& deviceName() const { return here(m_name); }
    const Way& way() const { return here(m_way); }
    /// Another device has the same name: the title tells by which way this one is reached and, from 1, which one of those
    /// by that way it is; 0 where there is only one.
    void tellApart(int number);

    std::string activityType() const override { return here(m_way).activityType; }
    std::string activityTitle() const override;
    std::string glyph() const override { return here(m_way).glyph; }
    std::string receiver() const override { return here(m_name); }

    bool canPerformWithActivityItems(const platform::ShareItems& items) const override;
    void prepareWithActivityItems(const platform::ShareItems& items) override;
    void performActivity() override;
    void cancel() override;

protected:
    struct File {
        std::shared_ptr<const sharing::Outbox::File> kept;
        std::string name; ///< as the user knows it
        std::uint64_t size = 0;

        const std::string& path() const { return kept->path(); }
    };

    const sharing::Environment& environment() const { return m_environment; }
    const std::vector<File>& files() const { return m_files; }

    /// The files are ready. Ends, at some time, with one of the ends below.
    virtual void send() = 0;
    /// Lets go of what send() began and is not over; called before each end. Destructors call it, too.
    virtual void stop() = 0;
    /// Whether copying into the outbox is worth being told: not where sending takes so much longer.
    virtual bool tellsCopying() const { return true; }

    void setProgress(double progress) const;
    void complete();
    /// `key` says what people have to do, with places for the device, the way and the file's name; `why` is for the log.
    void fail(const char* key, const std::string& fileName, const std::string& why);
    bool isUnderWay() const { return m_work != nullptr; }

private:
    using Prepared = base::Result<std::vector<File>>;

    void prepared(Prepared files);
    void fail(base::ErrorRef error);

    const sharing::Environment& m_environment;
    const Way& m_way;
    std::string m_name;
    std::optional<int> m_number;
    std::vector<std::pair<std::string, std::string>> m_toSend; ///< paths and names
    std::vector<File> m_files;
    std::shared_ptr<base::Work> m_work;
    std::shared_ptr<std::atomic<bool>> m_wanted; ///< by the worker's task
};

} // namespace devices
