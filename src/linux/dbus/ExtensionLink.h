/// The wire below ExtensionConnection: a connection, and a worker with an event loop on which replies arrive.
/// Any thread but for the destructor; this layer's own business.
#pragma once

#include "base/Result.h"
#include "platform/hosting/InputItem.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QObject>
#include <QThread>

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <string>

namespace dbus {

class DisconnectWatch;

class ExtensionLink {
public:
    /// `ended` runs once on the worker, when the other side has gone.
    ExtensionLink(QDBusConnection connection, std::function<void()> ended);
    /// Completes what is being loaded with an error, on the worker, then closes the connection.
    ~ExtensionLink();
    ExtensionLink(const ExtensionLink&) = delete;
    ExtensionLink& operator=(const ExtensionLink&) = delete;

    const QDBusConnection& connection() const { return m_connection; }

    /// Returns at once; `completion` runs on the worker.
    void load(std::uint32_t item, std::uint32_t attachment, std::string type,
              platform::ItemProvider::LoadCompletion completion);

    /// Sends a one-way message and a Ping behind it, whose reply tells that the message has arrived. `failed` runs, on
    /// the worker, only when the other side is there but does not answer. False when there is no other side.
    bool send(const QDBusMessage& message, std::function<void(const base::ErrorRef&)> failed);

    /// Until every message has arrived or the connection has ended; false when that takes longer than `limit`.
    bool flush(std::chrono::milliseconds limit);

private:
    void endOnWorker(const base::ErrorRef& why);
    void messageArrived();

    QDBusConnection m_connection;
    QThread m_thread;
    QObject m_worker; // lives on m_thread, as do its children
    std::function<void()> m_ended;

    // On the worker only.
    std::map<std::uint64_t, platform::ItemProvider::LoadCompletion> m_loads;
    std::uint64_t m_lastLoad = 0;

    std::mutex m_mutex; // guards what follows
    std::condition_variable m_changed;
    std::size_t m_underWay = 0;
    bool m_hasEnded = false;
};

} // namespace dbus
