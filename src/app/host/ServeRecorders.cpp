#include "app/host/ServeRecorders.h"

#include "app/host/EditorDirectory.h"
#include "app/host/EditorSession.h"
#include "app/host/ExitStatus.h"
#include "app/host/PrepareRequest.h"
#include "app/host/TerminationSignals.h"
#include "linux/dbus/RecorderService.h"

#include <QCoreApplication>

#include <cstdio>
#include <utility>

namespace host {

namespace {

class RecordersEditor final : public dbus::RecorderService::Editor {
public:
    explicit RecordersEditor(std::unique_ptr<EditorSession> session) : m_session(std::move(session)) {}

    void close() override { m_session->close(); }

private:
    std::unique_ptr<EditorSession> m_session;
};

std::string failureOf(const EditorOutcome& outcome)
{
    if (outcome.activityTypes)
        return {};
    if (outcome.error)
        return outcome.error->description();
    return outcome.closed ? "the editor was closed" : "the editor ended early, " + outcome.end.words();
}

base::Result<std::unique_ptr<dbus::RecorderService::Editor>> launch(dbus::EditRequest request,
                                                                    dbus::RecorderService::EditorEvents events)
{
    if (const auto prepared = prepare(request); !prepared)
        return prepared.error();
    const auto program = findEditorProgram();
    if (!program)
        return program.error();
    const auto root = editorDirectoriesRoot();
    if (!root)
        return root.error();
    EditorSession::Handlers handlers;
    handlers.finished = std::move(events.completed);
    handlers.ended = [ended = std::move(events.ended)](const EditorOutcome& outcome) { ended(failureOf(outcome)); };
    auto session = EditorSession::start(std::move(request), {program.value(), root.value()}, std::move(handlers));
    if (!session)
        return session.error();
    return std::unique_ptr<dbus::RecorderService::Editor>(
        std::make_unique<RecordersEditor>(std::move(session).value()));
}

} // namespace

int serveRecorders(const ServiceCommand& command)
{
    auto service = dbus::RecorderService::start(launch, command.idle, [] { QCoreApplication::exit(); });
    if (!service) {
        std::fprintf(stderr, "clipsa: %s\n", service.error()->description().c_str());
        return kExitFailed;
    }
    const TerminationSignals signals([&](int) { service.value()->close(); });
    QCoreApplication::exec();
    return kExitDone;
}

} // namespace host
