/// What is done when a call has been answered; this layer's own business.
#pragma once

#include <QDBusMessage>
#include <QDBusPendingCall>
#include <QObject>

#include <functional>

namespace dbus {

/// `answered` runs on the thread of `context`, once there is a reply or an error in its place, and never after `context`
/// is destroyed. To be called on that thread.
void whenAnswered(const QDBusPendingCall& call, QObject& context,
                  std::function<void(const QDBusMessage& reply)> answered);

} // namespace dbus
