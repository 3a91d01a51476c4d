#include "app/host/ServeRecorders.h"

#include "app/host/DetachedWork.h"
#include "app/host/EditorDirectory.h"
#include "app/host/EditorSession.h"
#include "app/host/ExitStatus.h"
#include "app/host/PrepareRequest.h"
#include "app/host/Streams.h"
#include "app/host/TerminationSignals.h"
#include "linux/dbus/RecorderService.h"

#include <QCoreApplication>

#include <cerrno>
#include <memory>
#include <optional>
#include <string>
#include <utility>

namespace host {

namespace {

/// First its request is made ready on a thread of its own, because a recorder's files may lie on a slow disk; then it
/// is a session.
class RecordersEditor final : public dbus::RecorderService::Editor {
public:
    RecordersEditor(dbus::EditRequest request, dbus::RecorderService::EditorEvents events) : m_events(std::move(events))
    {
        // Shared, because a function can be copied and a descriptor cannot.
        const auto shared = std::make_shared<dbus::EditRequest>(std::move(request));
        m_preparation.emplace([this, shared](DetachedWork::Client& client) {
            const auto prepared = prepare(*shared);
            client.post([this, shared, prepared] {
                tellStarted(prepared ? start(std::move(*shared)) : base::Result<void>(prepared.error()));
            });
        });
    }

    void close() override
    {
        if (m_session) {
            m_session->close();
            return;
        }
        m_preparation.reset();
        const auto tell = [this] {
            tellStarted(base::Error::make(base::kPosixErrorDomain, ECANCELED, "the editor was closed"));
        };
        QMetaObject::invokeMethod(&m_context, tell, Qt::QueuedConnection);
    }

private:
    void tellStarted(const base::Result<void>& started)
    {
        if (const auto tell = std::exchange(m_events.started, {}))
            tell(started);
    }

    base::Result<void> start(dbus::EditRequest request)
    {
        const auto program = findEditorProgram();
        if (!program)
            return program.error();
        const auto root = editorDirectoriesRoot();
        if (!root)
            return root.error();
        EditorSession::Handlers handlers;
        handlers.noted = m_events.noted;
        handlers.finished = m_events.completed;
        handlers.ended = [ended = m_events.ended](const EditorOutcome& outcome) { ended(outcome.failure()); };
        auto session = EditorSession::start(std::move(request), {program.value(), root.value()}, std::move(handlers));
        if (!session)
            return session.error();
        m_session = std::move(session).value();
        return {};
    }

    dbus::RecorderService::EditorEvents m_events;
    std::unique_ptr<EditorSession> m_session;
    std::optional<DetachedWork> m_preparation;
    QObject m_context;
};

} // namespace

int serveRecorders(const ServiceCommand& command)
{
    const auto launch = [](dbus::EditRequest request, dbus::RecorderService::EditorEvents events) {
        return std::make_unique<RecordersEditor>(std::move(request), std::move(events));
    };
    std::unique_ptr<dbus::RecorderService> service;
    const TerminationSignals signals([&](int) { service->close(); });
    auto started = dbus::RecorderService::start(launch, command.idle, [] { QCoreApplication::exit(); });
    if (!started) {
        complain(started.error()->description());
        return kExitFailed;
    }
    service = std::move(started).value();
    QCoreApplication::exec();
    return kExitDone;
}

} // namespace host
