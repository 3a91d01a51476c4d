#include "linux/dbus/RecorderService.h"

#include "base/Text.h"
#include "base/Url.h"
#include "linux/dbus/DisconnectWatch.h"
#include "linux/dbus/EditOptions.h"
#include "linux/dbus/Protocol.h"
#include "linux/dbus/RecorderIntrospection.h"
#include "linux/dbus/Reply.h"
#include "linux/dbus/SessionResult.h"
#include "linux/dbus/Wire.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusServiceWatcher>
#include <QDBusVirtualObject>
#include <QTimer>

#include <algorithm>
#include <cstdio>
#include <map>
#include <optional>
#include <utility>

namespace dbus {

namespace {

const char* const kName = "org.clipsa.Clipsa";
const char* const kPath = "/org/clipsa/Clipsa";
const char* const kRecorderInterface = "org.clipsa.Recorder1";
const char* const kSessionInterface = "org.clipsa.RecorderSession1";
const char* const kApplicationInterface = "org.freedesktop.Application";
const char* const kBadInput = "org.clipsa.Error.BadInput";
const char* const kFailed = "org.clipsa.Error.Failed";

} // namespace

class RecorderService::Bus final : public QDBusVirtualObject {
public:
    Bus(QDBusConnection connection, Launcher launcher, std::chrono::milliseconds idle, std::function<void()> whenIdle)
        : m_connection(std::move(connection)), m_launcher(std::move(launcher)), m_whenIdle(std::move(whenIdle))
    {
        m_idle.setSingleShot(true);
        m_idle.setInterval(idle);
        connect(&m_idle, &QTimer::timeout, this, &Bus::leave);
        m_callers.setConnection(m_connection);
        m_callers.setWatchMode(QDBusServiceWatcher::WatchForUnregistration);
        connect(&m_callers, &QDBusServiceWatcher::serviceUnregistered, this, &Bus::callerLeft);
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
        if (m_sessions.empty())
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
            refuse(message, "Clipsa has no window of its own; give it a recording to open");
        else if (isOurs && calls(kApplicationInterface, "ActivateAction"))
            refuse(message, "Clipsa has no actions");
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

    void answer(const QDBusMessage& message, const QVariantList& values = {})
    {
        if (message.isReplyRequired())
            m_connection.send(message.createReply(values));
    }

    void refuse(const QDBusMessage& message, const std::string& why, const char* error = kBadInput)
    {
        std::fprintf(stderr, "clipsa: %s\n", base::printable(why).c_str());
        if (message.isReplyRequired())
            m_connection.send(message.createErrorReply(QLatin1String(error), toQt(why)));
    }

    void refuse(const QDBusMessage& message, const base::ErrorRef& error)
    {
        refuse(message, error->description(), error->domain() == kBadInputDomain ? kBadInput : kFailed);
    }

    void edit(const QDBusMessage& message)
    {
        const QVariantList arguments = message.arguments();
        EditRequest request;
        request.movie = descriptorFrom(arguments.at(0));
        if (const auto taken = takeOptions(qdbus_cast<QVariantMap>(arguments.at(1)), request); !taken) {
            refuse(message, taken.error()->description());
            return;
        }
        launch(std::move(request), fromQt(message.service()), true,
               [=, this](const base::Result<std::uint64_t>& session) {
                   if (session)
                       answer(message, {QVariant::fromValue(QDBusObjectPath(pathOf(session.value())))});
                   else
                       refuse(message, session.error());
               });
    }

    void open(const QDBusMessage& message)
    {
        const auto data = qdbus_cast<QVariantMap>(message.arguments().at(1));
        const QStringList uris = message.arguments().at(0).toStringList();
        if (uris.isEmpty())
            answer(message);
        struct Answers {
            qsizetype missing;
            base::ErrorRef error;
        };
        const auto answers = std::make_shared<Answers>(Answers{uris.size(), nullptr});
        for (const QString& uri : uris) {
            const auto url = base::Url::fromString(fromQt(uri));
            EditRequest request;
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
                           refuse(message, answers->error);
                       else
                           answer(message);
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
            .noted = [this, number](const MovieNote& note) { tellNoted(number, note); },
            .completed =
                [this, number](const std::vector<std::string>& activityTypes) {
                    tell(number, QStringLiteral("Completed"), {toQt(activityTypes)});
                },
            .ended = [this, number](const std::string& failure) { tellEnded(number, failure); }};
        m_idle.stop();
        if (isCallers)
            watch(caller);
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

    void tellNoted(std::uint64_t number, const MovieNote& note)
    {
        if (note.kind == MovieNote::Kind::Saved)
            tell(number, QStringLiteral("Saved"), {toQt(note.path)});
        else if (note.kind == MovieNote::Kind::Unsaved)
            tell(number, QStringLiteral("SaveFailed"), {toQt(note.path), toQt(note.why)});
        tellResult(number, resultOf(note));
    }

    void tellResult(std::uint64_t number, const SessionResult& result)
    {
        QVariantMap members;
        for (const auto& [name, text] : result)
            members.insert(toQt(name), toQt(text));
        if (!members.isEmpty())
            tell(number, QStringLiteral("Result"), {members});
    }

    void tellEnded(std::uint64_t number, const std::string& failure)
    {
        if (!failure.empty()) {
            tell(number, QStringLiteral("Failed"), {toQt(failure)});
            tellResult(number, resultOfFailure(failure));
        }
        tell(number, QStringLiteral("Ended"), {});
        forgetLater(number);
    }

    /// The editor that calls us is destroyed with its session.
    void forgetLater(std::uint64_t number)
    {
        QMetaObject::invokeMethod(
            this, [this, number] { forget(number); }, Qt::QueuedConnection);
    }

    void tell(std::uint64_t number, const QString& signal, const QVariantList& values)
    {
        const auto session = m_sessions.find(number);
        if (session == m_sessions.end() || !session->second.isCallers)
            return;
        auto message = QDBusMessage::createTargetedSignal(toQt(session->second.caller), pathOf(number),
                                                          QLatin1String(kSessionInterface), signal);
        message.setArguments(values);
        m_connection.send(message);
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
            m_callers.removeWatchedService(toQt(caller));
        if (!m_sessions.empty())
            return;
        if (m_closing)
            leave();
        else
            m_idle.start();
    }

    void watch(const std::string& caller)
    {
        if (m_callers.watchedServices().contains(toQt(caller)))
            return;
        m_callers.addWatchedService(toQt(caller));
        // It may have left before we watched; then nobody says so any more.
        auto question = QDBusMessage::createMethodCall(
            QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
            QStringLiteral("org.freedesktop.DBus"), QStringLiteral("NameHasOwner"));
        whenAnswered(m_connection.asyncCall(question << toQt(caller)), *this,
                     [this, caller](const QDBusMessage& reply) {
                         if (reply.arguments() == QVariantList{false})
                             callerLeft(toQt(caller));
                     });
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
            refuse(message, "only the recorder that asked for a session can close it");
            return;
        }
        session.editor->close();
        answer(message);
    }

    /// Calls that reached us while we had the name are answered before we go; and what we sent has left when the bus
    /// has answered.
    void leave()
    {
        m_connection.unregisterService(QLatin1String(kName));
        QMetaObject::invokeMethod(
            this,
            [this] {
                if (m_sessions.empty())
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
    QDBusServiceWatcher m_callers;
    DisconnectWatch m_busWatch{[this] { close(); }}; // without a bus there is nobody to serve
    std::uint64_t m_lastSession = 0;
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
