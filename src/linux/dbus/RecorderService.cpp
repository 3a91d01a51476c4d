#include "linux/dbus/RecorderService.h"

#include "base/Url.h"
#include "linux/dbus/AskWho.h"
#include "linux/dbus/CallerWatch.h"
#include "linux/dbus/DisconnectWatch.h"
#include "linux/dbus/EditOptions.h"
#include "linux/dbus/Protocol.h"
#include "linux/dbus/RecorderAnswers.h"
#include "linux/dbus/RecorderIntrospection.h"
#include "linux/dbus/Wire.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVirtualObject>
#include <QTimer>

#include <algorithm>
#include <map>
#include <optional>
#include <utility>

namespace dbus {

namespace {

const char* const kName = "org.clipsa.Clipsa";
const char* const kPath = "/org/clipsa/Clipsa";
const char* const kRecorderInterface = "org.clipsa.Recorder1";
const char* const kApplicationInterface = "org.freedesktop.Application";

} // namespace

class RecorderService::Bus final : public QDBusVirtualObject {
public:
    Bus(QDBusConnection connection, Launcher launcher, std::chrono::milliseconds idle, std::function<void()> whenIdle)
        : m_connection(std::move(connection)), m_launcher(std::move(launcher)), m_whenIdle(std::move(whenIdle))
    {
        m_idle.setSingleShot(true);
        m_idle.setInterval(idle);
        connect(&m_idle, &QTimer::timeout, this, &Bus::leave);
    }

    ~Bus() override { QDBusConnection::disconnectFromBus(m_connection.name()); }

    base::Result<void> start()
    {
        m_connection.registerVirtualObject(QLatin1String(kPath), this, QDBusConnection::SubPath);
        if (!m_connection.registerService(QLatin1String(kName)))
            return base::Error::make(kErrorDomain, kRefused, "another clipsa service has the name org.clipsa.Clipsa");
        m_busWatch.watch(m_connection);
        m_idle.start();
        return {};
    }

    void close()
    {
        if (std::exchange(m_closing, true))
            return;
        for (const auto& [number, session] : m_sessions)
            session.editor->close();
        if (isIdle())
            leave();
    }

    QString introspect(const QString& path) const override
    {
        if (path == QLatin1String(kPath))
            return QString::fromLatin1(kServiceIntrospection);
        return sessionAt(path) ? QString::fromLatin1(kSessionIntrospection) : QString();
    }

    bool handleMessage(const QDBusMessage& message, const QDBusConnection&) override
    {
        const auto calls = [&](const char* interface, const char* member) {
            return message.interface() == QLatin1String(interface) && message.member() == QLatin1String(member);
        };
        const bool isOurs = message.path() == QLatin1String(kPath);
        const QString signature = message.signature();
        const Session* session = sessionAt(message.path());
        if (session && calls(kSessionInterface, "Close"))
            closeSession(message, *session);
        else if (isOurs && calls(kRecorderInterface, "Edit") && signature == QLatin1String("ha{sv}"))
            edit(message);
        else if (isOurs && calls(kApplicationInterface, "Open") && signature == QLatin1String("asa{sv}"))
            open(message);
        else if (isOurs && calls(kApplicationInterface, "Activate"))
            refuse(m_connection, message, "Clipsa has no window of its own; give it a recording to open");
        else if (isOurs && calls(kApplicationInterface, "ActivateAction"))
            refuse(m_connection, message, "Clipsa has no actions");
        else
            return false;
        return true;
    }

private:
    /// Told once: the number of the session, or why there is none.
    using Answer = std::function<void(const base::Result<std::uint64_t>& session)>;

    struct Session {
        std::string caller;
        bool isCallers; ///< it ends with its caller, who is told; else it is the user's alone
        Answer answer;
        std::unique_ptr<Editor> editor;
    };

    QString pathOf(std::uint64_t number) const
    {
        return QLatin1String(kPath) + QStringLiteral("/session/%1").arg(number);
    }

    const Session* sessionAt(const QString& path) const
    {
        for (const auto& [number, session] : m_sessions)
            if (pathOf(number) == path)
                return &session;
        return nullptr;
    }

    void edit(const QDBusMessage& message)
    {
        const QVariantList arguments = message.arguments();
        EditRequest request;
        request.movie = descriptorFrom(arguments.at(0));
        if (const auto taken = takeOptions(qdbus_cast<QVariantMap>(arguments.at(1)), request); !taken) {
            refuse(m_connection, message, taken.error());
            return;
        }
        const auto whenStarted = [=, this](const base::Result<std::uint64_t>& session) {
            if (session)
                answer(m_connection, message, {QVariant::fromValue(QDBusObjectPath(pathOf(session.value())))});
            else
                refuse(m_connection, message, session.error());
        };
        if (request.attachmentPath.empty()) {
            launch(std::move(request), fromQt(message.service()), true, whenStarted);
            return;
        }
        // Shared, because a function can be copied and a request cannot.
        const auto shared = std::make_shared<EditRequest>(std::move(request));
        whenKnown(message.service(), [=, this](std::shared_ptr<const Asker> asker) {
            shared->asker = std::move(asker);
            launch(std::move(*shared), fromQt(message.service()), true, whenStarted);
        });
    }

    /// Whoever names files has a right to them, or not.
    void whenKnown(const QString& caller, std::function<void(std::shared_ptr<const Asker> asker)> then)
    {
        ++m_questions;
        m_idle.stop();
        askWho(m_connection, caller, *this, [this, then = std::move(then)](std::shared_ptr<const Asker> asker) {
            --m_questions;
            then(std::move(asker));
            rest(); // unless it was launched
        });
    }

    void open(const QDBusMessage& message)
    {
        if (message.arguments().at(0).toStringList().isEmpty())
            answer(m_connection, message);
        else
            whenKnown(message.service(),
                      [=, this](const std::shared_ptr<const Asker>& asker) { open(message, asker); });
    }

    void open(const QDBusMessage& message, const std::shared_ptr<const Asker>& asker)
    {
        const auto data = qdbus_cast<QVariantMap>(message.arguments().at(1));
        const QStringList uris = message.arguments().at(0).toStringList();
        struct Answers {
            qsizetype missing;
            base::ErrorRef error;
        };
        const auto answers = std::make_shared<Answers>(Answers{uris.size(), nullptr});
        for (const QString& uri : uris) {
            const auto url = base::Url::fromString(fromQt(uri));
            EditRequest request;
            request.asker = asker;
            request.moviePath = url && url->isFile() ? url->path() : fromQt(uri);
            request.editorArguments = {"--explain"}; // file managers do not wait for how it ends
            takePlatformData(data, request);
            launch(std::move(request), fromQt(message.service()), false,
                   [=, this](const base::Result<std::uint64_t>& session) {
                       if (!session)
                           answers->error = session.error();
                       if (--answers->missing > 0)
                           return;
                       if (answers->error)
                           refuse(m_connection, message, answers->error);
                       else
                           answer(m_connection, message);
                   });
        }
    }

    base::Result<void> mayLaunchFor(const std::string& caller) const
    {
        if (m_closing)
            return base::Error::make(kErrorDomain, kNotConnected, "Clipsa is being closed");
        const auto isTheirs = [&](const auto& entry) { return entry.second.caller == caller; };
        if (std::count_if(m_sessions.begin(), m_sessions.end(), isTheirs) >= kMaximumSessions)
            return base::Error::make(kErrorDomain, kRefused,
                                     "you have " + std::to_string(kMaximumSessions)
                                         + " recordings open in Clipsa; close one of them first");
        return {};
    }

    void launch(EditRequest request, std::string caller, bool isCallers, Answer whenStarted)
    {
        if (const auto may = mayLaunchFor(caller); !may) {
            whenStarted(may.error());
            return;
        }
        const std::uint64_t number = ++m_lastSession;
        EditorEvents events{
            .started = [this, number](const base::Result<void>& started) { tellStarted(number, started); },
            .noted =
                [this, number](const MovieNote& note) {
                    if (const auto session = listenerOf(number))
                        tellNote(m_connection, *session, note);
                },
            .completed =
                [this, number](const std::vector<std::string>& activityTypes) {
                    if (const auto session = listenerOf(number))
                        tellCompleted(m_connection, *session, activityTypes);
                },
            .ended =
                [this, number](const std::string& failure) {
                    if (const auto session = listenerOf(number))
                        tellEnded(m_connection, *session, failure);
                    forgetLater(number);
                }};
        m_idle.stop();
        if (isCallers)
            m_callers.watch(toQt(caller));
        auto editor = m_launcher(std::move(request), std::move(events));
        m_sessions.emplace(number, Session{std::move(caller), isCallers, std::move(whenStarted), std::move(editor)});
    }

    void tellStarted(std::uint64_t number, const base::Result<void>& started)
    {
        const Answer tellCaller = std::exchange(m_sessions.at(number).answer, {});
        if (started) {
            tellCaller(number);
            return;
        }
        tellCaller(started.error());
        forgetLater(number);
    }

    /// The editor that calls us is destroyed with its session.
    void forgetLater(std::uint64_t number)
    {
        QMetaObject::invokeMethod(
            this, [this, number] { forget(number); }, Qt::QueuedConnection);
    }

    /// Nothing where nobody wants to know.
    std::optional<SessionAddress> listenerOf(std::uint64_t number) const
    {
        const auto session = m_sessions.find(number);
        if (session == m_sessions.end() || !session->second.isCallers)
            return std::nullopt;
        return SessionAddress{toQt(session->second.caller), pathOf(number)};
    }

    void forget(std::uint64_t number)
    {
        auto session = m_sessions.extract(number);
        if (session.empty())
            return;
        const std::string& caller = session.mapped().caller;
        bool watched = false;
        for (const auto& [other, living] : m_sessions)
            watched |= living.isCallers && living.caller == caller;
        if (!watched)
            m_callers.forget(toQt(caller));
        rest();
    }

    bool isIdle() const { return m_sessions.empty() && m_questions == 0; }

    void rest()
    {
        if (!isIdle())
            return;
        if (m_closing)
            leave();
        else
            m_idle.start();
    }

    void callerLeft(const QString& name)
    {
        for (const auto& [number, session] : m_sessions)
            if (session.isCallers && session.caller == fromQt(name))
                session.editor->close();
    }

    void closeSession(const QDBusMessage& message, const Session& session)
    {
        if (!session.isCallers || session.caller != fromQt(message.service())) {
            refuse(m_connection, message, "only the recorder that asked for a session can close it");
            return;
        }
        session.editor->close();
        answer(m_connection, message);
    }

    /// Calls that reached us while we had the name are answered before we go; and what we sent has left when the bus
    /// has answered.
    void leave()
    {
        m_connection.unregisterService(QLatin1String(kName));
        QMetaObject::invokeMethod(
            this,
            [this] {
                if (isIdle())
                    m_whenIdle();
                else
                    m_connection.registerService(QLatin1String(kName));
            },
            Qt::QueuedConnection);
    }

    QDBusConnection m_connection;
    Launcher m_launcher;
    std::function<void()> m_whenIdle;
    QTimer m_idle;
    CallerWatch m_callers{m_connection, [this](const QString& name) { callerLeft(name); }};
    DisconnectWatch m_busWatch{[this] { close(); }}; // without a bus there is nobody to serve
    std::uint64_t m_lastSession = 0;
    int m_questions = 0; ///< about callers, which are still to be answered
    bool m_closing = false;
    std::map<std::uint64_t, Session> m_sessions;
};

RecorderService::RecorderService(std::unique_ptr<Bus> bus) : m_bus(std::move(bus)) {}

RecorderService::~RecorderService()
{
    m_affinity.assertHere();
}

base::Result<std::unique_ptr<RecorderService>> RecorderService::start(Launcher launcher, std::chrono::milliseconds idle,
                                                                      std::function<void()> whenIdle)
{
    // Of its own, so that the name goes when the service goes.
    const auto connection = QDBusConnection::connectToBus(QDBusConnection::SessionBus, newConnectionName());
    if (!connection.isConnected())
        return base::Error::make(
            kErrorDomain, kNotConnected,
            "there is no session bus; start this in a graphical session, or with dbus-run-session");
    auto bus = std::make_unique<Bus>(connection, std::move(launcher), idle, std::move(whenIdle));
    if (const auto started = bus->start(); !started)
        return started.error();
    return std::unique_ptr<RecorderService>(new RecorderService(std::move(bus)));
}

void RecorderService::close()
{
    m_affinity.assertHere();
    m_bus->close();
}

} // namespace dbus
