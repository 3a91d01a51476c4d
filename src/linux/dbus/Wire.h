/// How the payload's values travel: D-Bus types and the platform's, each made from the other. Any thread; this layer's
/// own business.
#pragma once

#include "base/Result.h"
#include "platform/views/Color.h"
#include "runtime/Value.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QList>
#include <QString>
#include <QStringList>
#include <QVariant>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace dbus {

/// One input item without its contents: `(saas)`.
struct WireItem {
    QString title;
    QList<QStringList> attachments; ///< the types that each conforms to
};

/// Red, green, blue and opacity: `(dddd)`.
struct WireColor {
    platform::Color color;
};

QDBusArgument& operator<<(QDBusArgument& out, const WireItem& item);
const QDBusArgument& operator>>(const QDBusArgument& in, WireItem& item);
QDBusArgument& operator<<(QDBusArgument& out, const WireColor& wire);
const QDBusArgument& operator>>(const QDBusArgument& in, WireColor& wire);

/// Makes the types above known to QtDBus; before any of them travels.
void registerWireTypes();

/// For a connection of one's own; QtDBus tells them apart by their names.
QString newConnectionName();

QString toQt(std::string_view text);
std::string fromQt(const QString& text);
QStringList toQt(const std::vector<std::string>& texts);
std::vector<std::string> fromQt(const QStringList& texts);

/// `std::string` and `platform::Color` for the payload; lists of strings too for messages. An error for all else.
base::Result<QVariant> toWire(const runtime::Value& value);

/// The list of items; an error when the reply is not one, or a list longer than anybody has use for.
base::Result<QList<WireItem>> itemsFromReply(const QDBusMessage& reply);

/// What a payload item holds, from the reply to LoadItem. Contents that are neither text nor a colour, do not fit the
/// type that was asked for, or are too large are errors.
base::Result<runtime::Value> itemFromReply(const QDBusMessage& reply, std::string_view type);

/// An error that came back, or that QtDBus made because nothing did.
base::ErrorRef errorFromReply(const QDBusMessage& reply);

} // namespace dbus

Q_DECLARE_METATYPE(dbus::WireItem)
Q_DECLARE_METATYPE(dbus::WireColor)
