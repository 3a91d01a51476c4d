#include "linux/dbus/Reply.h"

#include <QDBusPendingCallWatcher>
#include <QThread>

#include <cassert>
#include <utility>

namespace dbus {

void whenAnswered(const QDBusPendingCall& call, QObject& context,
                  std::function<void(const QDBusMessage& reply)> answered)
{
    assert(context.thread() == QThread::currentThread());
    auto* watcher = new QDBusPendingCallWatcher(call, &context);
    QObject::connect(watcher, &QDBusPendingCallWatcher::finished, &context,
                     [answered = std::move(answered)](QDBusPendingCallWatcher* finished) {
                         finished->deleteLater();
                         answered(finished->reply());
                     });
}

} // namespace dbus
