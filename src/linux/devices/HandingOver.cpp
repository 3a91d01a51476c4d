#include "linux/devices/HandingOver.h"

#include "base/Url.h"

#include <utility>

namespace devices {

namespace {

/// The service does not have what was asked for: that goes when the device does.
bool saysUnknown(const QDBusMessage& error)
{
    const QString name = error.errorName();
    return name == QLatin1String("org.freedesktop.DBus.Error.UnknownObject")
           || name == QLatin1String("org.freedesktop.DBus.Error.UnknownInterface")
           || name == QLatin1String("org.freedesktop.DBus.Error.UnknownMethod");
}

/// Nobody is there any more who could have answered.
bool saysGone(const QDBusMessage& error)
{
    const QString name = error.errorName();
    return name == QLatin1String("org.freedesktop.DBus.Error.ServiceUnknown")
           || name == QLatin1String("org.freedesktop.DBus.Error.NameHasNoOwner")
           || name == QLatin1String("org.freedesktop.DBus.Error.NoReply")
           || name == QLatin1String("org.freedesktop.DBus.Error.Disconnected");
}

} // namespace

HandingOver::HandingOver(const sharing::Environment& environment, const Way& way, std::string_view name,
                         QDBusConnection bus)
    : DeviceActivity(environment, way, name), m_bus(std::move(bus)), m_calls(environment.system.mainQueue)
{
}

void HandingOver::send()
{
    m_next = 0;
    handOverNext();
}

void HandingOver::handOverNext()
{
    if (m_next == files().size()) {
        complete();
        return;
    }
    handOver(QString::fromStdString(base::Url::fromPath(files()[m_next].path()).string()));
}

void HandingOver::ask(const QDBusMessage& question, Calls::Answer answer)
{
    m_calls.ask(m_bus, question, kLimit, [this, answer = std::move(answer)](const QDBusMessage& reply) {
        if (reply.type() == QDBusMessage::ReplyMessage)
            answer(reply);
        else
            failed(reply);
    });
}

void HandingOver::accepted()
{
    ++m_next;
    handOverNext();
}

void HandingOver::deviceGone(const std::string& why)
{
    fail("SHARE_DEVICE_GONE", files()[m_next].name, why);
}

void HandingOver::failed(const QDBusMessage& reply)
{
    if (saysUnknown(reply))
        deviceGone(wordsForLog(reply));
    else if (saysGone(reply))
        fail("SHARE_DEVICE_SERVICE_GONE", files()[m_next].name, wordsForLog(reply));
    else if (reply.errorName() == QDBusError::errorString(QDBusError::TimedOut))
        fail("SHARE_DEVICE_SERVICE_SILENT", files()[m_next].name, wordsForLog(reply));
    else
        fail("SHARE_DEVICE_SERVICE_REFUSED", files()[m_next].name, wordsForLog(reply));
}

std::string wordsForLog(const QDBusMessage& error)
{
    return (error.errorName() + QStringLiteral(": ") + error.errorMessage()).toStdString();
}

} // namespace devices
