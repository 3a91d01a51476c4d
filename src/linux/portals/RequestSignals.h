/// What the bus tells of one request, passed on. Lives on the thread that is told; this layer's own business.
#pragma once

#include "base/Affinity.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QObject>

#include <functional>

namespace portals {

class RequestSignals final : public QObject {
    Q_OBJECT

public:
    std::function<void(const QDBusMessage& response)> responded;
    std::function<void(const QDBusMessage& change)> ownerChanged;
    std::function<void()> busEnded;

    /// To the responses of the request at `path`, by nobody but `owner`.
    void listenToRequest(QDBusConnection bus, const QString& owner, const QString& path);
    /// To changes of the name `owner`, and to the end of the bus, which takes all names with it and says so of none.
    void listenToOwner(QDBusConnection bus, const QString& owner);

private Q_SLOTS:
    void respond(const QDBusMessage& response);
    void changeOwner(const QDBusMessage& change);
    void endBus();

private:
    base::Affinity m_affinity;
};

} // namespace portals
