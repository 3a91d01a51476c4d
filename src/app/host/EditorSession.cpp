#include "app/host/EditorSession.h"

#include "app/host/DeliverFiles.h"
#include "app/host/DetachedWork.h"
#include "app/host/EditorDirectory.h"
#include "app/host/Payload.h"
#include "linux/dbus/BusyMark.h"
#include "linux/dbus/HostConnection.h"

#include <QObject>
#include <QTimer>

#include <cerrno>
#include <csignal>
#include <utility>

namespace host {

namespace {

/// How long the last words of a process that has ended can be under way to us.
constexpr std::chrono::milliseconds kLastWordsLimit{500};

} // namespace

std::string EditorOutcome::words() const
{
    if (end.signal == 0 && end.exitStatus == 0)
        return "the editor was closed before it showed the recording";
    return "the editor ended early, " + end.words();
}

std::string EditorOutcome::failure() const
{
    if (activityTypes)
        return {};
    if (error)
        return error->description();
    return closed ? "the editor was closed" : words();
}

struct EditorSession::State final : QObject {
    State(dbus::EditRequest editRequest, EditorDirectory editorDirectory, dbus::EditorReport editorReport,
          const Place& editorPlace, Handlers callbacks)
        : request(std::move(editRequest)), directory(std::move(editorDirectory)), report(std::move(editorReport)),
          place(editorPlace), handlers(std::move(callbacks)), movie(std::make_shared<Promise>())
    {
        if (request.attachment || !request.attachmentPath.empty())
            attachment = std::make_shared<Promise>();
        timer.setSingleShot(true);
        connect(&timer, &QTimer::timeout, this, &State::whenTimeIsUp);
    }

    base::Result<void> start();
    void handFilesOver();
    void close();
    void whenTimeIsUp();
    void processEnded(ProcessEnd end);
    void tellNotes();
    void end();
    void leave();

    // In the order in which they must outlive each other: the directory goes when the process has gone.
    dbus::EditRequest request;
    EditorDirectory directory;
    dbus::EditorReport report;
    std::size_t toldNotes = 0; ///< of the report
    Place place;
    Handlers handlers;
    std::shared_ptr<Promise> movie;
    std::shared_ptr<Promise> attachment;
    std::unique_ptr<dbus::HostConnection> connection;
    std::unique_ptr<EditorProcess> process;
    QTimer timer;
    int nextSignal = SIGTERM;
    std::optional<ProcessEnd> processEnd;
    EditorOutcome outcome;
    bool closing = false;
    bool filesAreDone = false; ///< delivered or not, and directories of dead editors swept
    bool waitsForFiles = false;
    std::optional<DetachedWork> files;
};

base::Result<void> EditorSession::State::start()
{
    const auto socket = directory.socketPath();
    if (!socket)
        return socket.error();
    auto listening =
        dbus::HostConnection::listen(socket.value(), payloadItems(request, movie, attachment),
                                     {.editorConnected = {},
                                      .finished =
                                          [this](std::vector<std::string> activityTypes) {
                                              outcome.activityTypes = std::move(activityTypes);
                                              tellNotes();
                                              // Later, because closing destroys what calls us.
                                              QMetaObject::invokeMethod(this, &State::close, Qt::QueuedConnection);
                                              if (handlers.finished)
                                                  handlers.finished(*outcome.activityTypes);
                                          },
                                      .disconnected =
                                          [this] {
                                              // Its process should go too, but something can hold it up.
                                              QMetaObject::invokeMethod(this, &State::close, Qt::QueuedConnection);
                                          }});
    if (!listening)
        return listening.error();
    connection = std::move(listening).value();

    ProcessStart editor{place.editorProgram,
                        {"--connect", connection->address(), "--device-root", directory.deviceRoot(), "--report",
                         std::to_string(dbus::kEditorReportDescriptor)},
                        request.environment,
                        directory.lock(),
                        report.descriptor()};
    editor.arguments.insert(editor.arguments.end(), request.editorArguments.begin(), request.editorArguments.end());
    auto started = EditorProcess::start(editor, [this](ProcessEnd ended) { processEnded(ended); });
    if (!started)
        return started.error();
    process = std::move(started).value();
    handFilesOver();
    return {};
}

void EditorSession::State::handFilesOver()
{
    // Shared, because a function can be copied and a descriptor cannot.
    const auto delivery = std::make_shared<FileDelivery>(
        FileDelivery{std::move(request.movie), request.movieName, directory.movieDirectory(), movie, attachment,
                     request.attachmentPath, std::move(request.attachment), request.attachmentName,
                     directory.attachmentDirectory()});
    const DeliveryEvents events{[this](std::uint64_t total) {
                                    if (handlers.copying)
                                        handlers.copying(total);
                                },
                                [this](const base::ErrorRef& error) {
                                    if (!closing)
                                        outcome.error = error;
                                    close();
                                }};
    files.emplace([this, delivery, events, root = place.directoriesRoot](DetachedWork::Client& client) {
        deliverFiles(*delivery, events, client, base::SystemClock());
        sweepEditorDirectories(root);
        client.post([this] {
            filesAreDone = true;
            if (waitsForFiles)
                leave();
        });
    });
}

void EditorSession::State::close()
{
    if (std::exchange(closing, true))
        return;
    files->cancel(); // nobody waits for the movie any more
    connection->disconnectEditor();
    if (processEnd)
        QMetaObject::invokeMethod(this, &State::end, Qt::QueuedConnection);
    else
        timer.start(place.leavingLimit);
}

void EditorSession::State::whenTimeIsUp()
{
    if (processEnd) {
        // Not inside the timer that it destroys.
        QMetaObject::invokeMethod(this, waitsForFiles ? &State::leave : &State::close, Qt::QueuedConnection);
        return;
    }
    // One that has something to finish, a save for example, takes as long as that takes.
    if (!dbus::BusyMark::isSet(directory.deviceRoot()))
        process->signal(std::exchange(nextSignal, SIGKILL));
    timer.start(place.leavingLimit);
}

void EditorSession::State::processEnded(ProcessEnd ended)
{
    processEnd = ended;
    // The last message can still be under way when its sender has ended; the end of the connection comes behind it.
    if (closing)
        end();
    else
        timer.start(kLastWordsLimit);
}

void EditorSession::State::tellNotes()
{
    const std::vector<dbus::MovieNote> notes = report.notes();
    for (; toldNotes < notes.size(); ++toldNotes) {
        const dbus::MovieNote& note = notes[toldNotes];
        if (note.kind == dbus::MovieNote::Kind::Refused)
            outcome.error = base::Error::make(dbus::kBadInputDomain, EINVAL, note.why);
        if (handlers.noted)
            handlers.noted(note);
    }
}

void EditorSession::State::end()
{
    if (std::exchange(waitsForFiles, true))
        return;
    if (filesAreDone)
        leave();
    else
        timer.start(place.filesLimit);
}

void EditorSession::State::leave()
{
    tellNotes();
    outcome.end = processEnd.value_or(ProcessEnd{});
    if (const auto ended = std::exchange(handlers.ended, {}))
        ended(outcome); // may destroy us
}

EditorSession::EditorSession(std::unique_ptr<State> state) : m_state(std::move(state)) {}

EditorSession::~EditorSession()
{
    m_affinity.assertHere();
}

base::Result<std::unique_ptr<EditorSession>> EditorSession::start(dbus::EditRequest request, const Place& place,
                                                                  Handlers handlers)
{
    auto directory = EditorDirectory::make(place.directoriesRoot);
    if (!directory)
        return directory.error();
    auto report = dbus::EditorReport::make();
    if (!report)
        return report.error();
    auto state = std::make_unique<State>(std::move(request), std::move(directory).value(), std::move(report).value(),
                                         place, std::move(handlers));
    if (const auto started = state->start(); !started)
        return started.error();
    return std::unique_ptr<EditorSession>(new EditorSession(std::move(state)));
}

void EditorSession::close()
{
    m_affinity.assertHere();
    m_state->outcome.closed = true;
    m_state->close();
}

} // namespace host
