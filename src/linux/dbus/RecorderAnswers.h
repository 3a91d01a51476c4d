/// What the service says to recorders on the bus: replies, refusals, and the signals of their sessions. A value; lives on
/// the service's thread; this layer's own business.
#pragma once

#include "base/Error.h"
#include "linux/dbus/EditorReport.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QString>
#include <QVariantList>

#include <string>
#include <vector>

namespace dbus {

inline constexpr const char* kSessionInterface = "org.clipsa.RecorderSession1";

/// Does nothing for a call that wants no reply.
void answer(const QDBusConnection& bus, const QDBusMessage& call, const QVariantList& values = {});

/// Says it in the log, too, in one line; what an error has under kUntoldKey is for that alone.
void refuse(const QDBusConnection& bus, const QDBusMessage& call, const base::ErrorRef& error);
/// The same, of what is the caller's own fault.
void refuse(const QDBusConnection& bus, const QDBusMessage& call, const std::string& why);

/// Whose session it is, and its object. Nobody else hears of it.
struct SessionAddress {
    QString caller;
    QString path;
};

void tellNote(const QDBusConnection& bus, const SessionAddress& session, const MovieNote& note);
void tellCompleted(const QDBusConnection& bus, const SessionAddress& session, const std::vector<std::string>& types);
/// The last. Why the user did not get to finish; empty when they did.
void tellEnded(const QDBusConnection& bus, const SessionAddress& session, const std::string& failure);

} // namespace dbus
