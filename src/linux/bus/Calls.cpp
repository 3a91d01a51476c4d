#include "linux/bus/Calls.h"

#include <QCoreApplication>
#include <QDBusPendingCallWatcher>

#include <utility>

namespace bus {

namespace {

/// Longer than any limit: what has not come by then is not undone either.
constexpr int kForgottenMilliseconds = 120'000;

} // namespace

Calls::Calls(base::MainQueue& queue) : m_queue(queue) {}

Calls::~Calls()
{
    m_affinity.assertHere();
}

void Calls::forget()
{
    m_affinity.assertHere();
    m_state->answers.clear();
}

void Calls::ask(const QDBusConnection& bus, const QDBusMessage& question, base::Instant limit, Answer answer,
                Answer late)
{
    m_affinity.assertHere();
    const std::uint64_t call = ++m_state->last;
    m_state->answers.emplace(call, std::move(answer));
    const auto tell = [weak = std::weak_ptr(m_state), call](const QDBusMessage& reply) {
        const auto state = weak.lock();
        if (!state)
            return false;
        auto found = state->answers.extract(call);
        if (found.empty())
            return false;
        found.mapped()(reply);
        return true;
    };
    // It is the application's: an answer that nobody waits for any more has to be heard, too.
    auto* watcher =
        new QDBusPendingCallWatcher(bus.asyncCall(question, kForgottenMilliseconds), QCoreApplication::instance());
    QObject::connect(watcher, &QDBusPendingCallWatcher::finished, watcher,
                     [tell, late = std::move(late)](QDBusPendingCallWatcher* finished) {
                         finished->deleteLater();
                         const QDBusMessage reply = finished->reply();
                         if (!tell(reply) && late)
                             late(reply);
                     });
    m_queue.postAfter(limit, [tell] {
        tell(QDBusMessage::createError(QDBusError::TimedOut, QStringLiteral("there was no answer in time")));
    });
}

QDBusMessage question(const QString& service, const QString& path, const char* interface, const char* member,
                      const QVariantList& arguments)
{
    auto message = QDBusMessage::createMethodCall(service, path, QLatin1String(interface), QLatin1String(member));
    message.setArguments(arguments);
    message.setAutoStartService(false);
    return message;
}

QDBusMessage questionToBus(const char* member, const QVariantList& arguments)
{
    return question(QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
                    "org.freedesktop.DBus", member, arguments);
}

bool isReply(const QDBusMessage& reply, const char* signature)
{
    return reply.type() == QDBusMessage::ReplyMessage && reply.signature() == QLatin1String(signature);
}

} // namespace bus
