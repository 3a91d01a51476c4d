#include "linux/dbus/Wire.h"

#include "linux/dbus/Protocol.h"
#include "platform/hosting/InputItem.h"

#include <QDBusMetaType>
#include <QDBusVariant>
#include <QUuid>

#include <mutex>

namespace dbus {

namespace {

base::ErrorRef malformed(const std::string& what)
{
    return base::Error::make(kErrorDomain, kMalformed, what);
}

bool isShare(double part)
{
    return part >= 0 && part <= 1; // not for NaN
}

base::Result<runtime::Value> colorFrom(const QDBusArgument& argument)
{
    if (argument.currentSignature() != QStringLiteral("(dddd)"))
        return malformed("the host sent neither text nor a colour");
    const platform::Color color = qdbus_cast<WireColor>(argument).color;
    if (!isShare(color.red) || !isShare(color.green) || !isShare(color.blue) || !isShare(color.alpha))
        return malformed("the host sent a colour with a part outside 0 to 1");
    return runtime::Value(color);
}

} // namespace

QDBusArgument& operator<<(QDBusArgument& out, const WireItem& item)
{
    out.beginStructure();
    out << item.title << item.attachments;
    out.endStructure();
    return out;
}

const QDBusArgument& operator>>(const QDBusArgument& in, WireItem& item)
{
    in.beginStructure();
    in >> item.title >> item.attachments;
    in.endStructure();
    return in;
}

QDBusArgument& operator<<(QDBusArgument& out, const WireColor& wire)
{
    const platform::Color& color = wire.color;
    out.beginStructure();
    out << color.red << color.green << color.blue << color.alpha;
    out.endStructure();
    return out;
}

const QDBusArgument& operator>>(const QDBusArgument& in, WireColor& wire)
{
    platform::Color& color = wire.color;
    in.beginStructure();
    in >> color.red >> color.green >> color.blue >> color.alpha;
    in.endStructure();
    return in;
}

void registerWireTypes()
{
    static std::once_flag once;
    std::call_once(once, [] {
        qDBusRegisterMetaType<WireItem>();
        qDBusRegisterMetaType<QList<WireItem>>();
        qDBusRegisterMetaType<WireColor>();
    });
}

QString newConnectionName()
{
    return QStringLiteral("clipsa-") + QUuid::createUuid().toString(QUuid::WithoutBraces);
}

QString toQt(std::string_view text)
{
    return QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
}

std::string fromQt(const QString& text)
{
    return text.toStdString();
}

QStringList toQt(const std::vector<std::string>& texts)
{
    QStringList list;
    for (const std::string& text : texts)
        list.append(toQt(text));
    return list;
}

std::vector<std::string> fromQt(const QStringList& texts)
{
    std::vector<std::string> list;
    for (const QString& text : texts)
        list.push_back(fromQt(text));
    return list;
}

base::Result<QVariant> toWire(const runtime::Value& value)
{
    if (const auto* text = std::any_cast<std::string>(&value)) {
        if (text->size() > kMaximumTextSize)
            return base::Error::make(kErrorDomain, kTooLarge, "the text is longer than 1 MiB");
        return QVariant(toQt(*text));
    }
    if (const auto* color = std::any_cast<platform::Color>(&value))
        return QVariant::fromValue(WireColor{*color});
    if (const auto* texts = std::any_cast<std::vector<std::string>>(&value))
        return QVariant(toQt(*texts));
    return base::Error::make(kErrorDomain, kBadArgument, "a value of this type cannot travel");
}

base::Result<QList<WireItem>> itemsFromReply(const QDBusMessage& reply)
{
    if (reply.type() != QDBusMessage::ReplyMessage)
        return errorFromReply(reply);
    if (reply.signature() != QStringLiteral("a(saas)"))
        return malformed("the host's list of items has another form than ours");
    const auto items = qdbus_cast<QList<WireItem>>(reply.arguments().constFirst());
    if (items.size() > static_cast<qsizetype>(kMaximumCount))
        return base::Error::make(kErrorDomain, kTooLarge, "the host sent more items than anybody has use for");
    return items;
}

base::Result<runtime::Value> itemFromReply(const QDBusMessage& reply, std::string_view type)
{
    if (reply.type() != QDBusMessage::ReplyMessage)
        return errorFromReply(reply);
    const QVariantList arguments = reply.arguments();
    if (arguments.size() != 1 || arguments.first().metaType() != QMetaType::fromType<QDBusVariant>())
        return malformed("the host's reply is not one value");
    const QVariant value = arguments.first().value<QDBusVariant>().variant();

    const bool generic = type == platform::kGenericDataType;
    if (value.metaType() == QMetaType::fromType<QString>() && (generic || type == platform::kTextType)) {
        std::string text = fromQt(value.toString());
        if (text.size() > kMaximumTextSize)
            return base::Error::make(kErrorDomain, kTooLarge, "the host sent a text longer than 1 MiB");
        return runtime::Value(std::move(text));
    }
    if (value.metaType() == QMetaType::fromType<QDBusArgument>() && (generic || type == platform::kColorType))
        return colorFrom(value.value<QDBusArgument>());
    return malformed("the host sent a value of another type than was asked for");
}

base::ErrorRef errorFromReply(const QDBusMessage& reply)
{
    if (reply.type() != QDBusMessage::ErrorMessage)
        return base::Error::make(kErrorDomain, kNotConnected, "the connection ended");
    return base::Error::make(kErrorDomain, kRefused, fromQt(reply.errorName() + ": " + reply.errorMessage()));
}

} // namespace dbus
