/// Hands files one after the other to a service that says of each only whether it takes it; this layer's own business.
#pragma once

#include "linux/devices/Calls.h"
#include "linux/devices/DeviceActivity.h"

#include <chrono>

namespace devices {

class HandingOver : public DeviceActivity {
public:
    /// A service that has not answered by then is not going to.
    static constexpr std::chrono::seconds kLimit{10};

    HandingOver(const sharing::Environment& environment, const Way& way, std::string_view name, QDBusConnection bus);

protected:
    /// Hands over the file at `address`, and calls accepted() or refused().
    virtual void handOver(const QString& address) = 0;

    /// Asks for this file; nothing is heard once it is over. `answer` hears replies only: errors end it.
    void ask(const QDBusMessage& question, Calls::Answer answer);
    void accepted();
    /// The device is there no more, as the service says.
    void deviceGone(const std::string& why);

private:
    void send() final;
    void stop() final { m_calls.forget(); }
    void handOverNext();
    void failed(const QDBusMessage& reply);

    QDBusConnection m_bus;
    Calls m_calls;
    std::size_t m_next = 0;
};

/// An error as the log has it.
std::string wordsForLog(const QDBusMessage& error);

} // namespace devices
