#include "app/host/OpenMovie.h"

#include "app/host/EditorDirectory.h"
#include "app/host/EditorSession.h"
#include "app/host/PrepareRequest.h"
#include "app/host/Streams.h"
#include "app/host/TerminationSignals.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <cstdio>
#include <utility>

namespace host {

namespace {

void print(const std::vector<std::string>& activityTypes, const OpenCommand& command, const std::string& movie)
{
    if (command.json) {
        QJsonArray types;
        for (const std::string& type : activityTypes)
            types.append(QString::fromStdString(type));
        const QJsonObject object{{QStringLiteral("activityTypes"), types},
                                 {QStringLiteral("movie"), QString::fromStdString(movie)}};
        std::printf("%s\n", QJsonDocument(object).toJson(QJsonDocument::Compact).constData());
    } else {
        for (const std::string& type : activityTypes)
            std::printf("%s\n", type.c_str());
    }
    std::fflush(stdout);
}

int exitStatus(const EditorOutcome& outcome, const std::string& movie)
{
    if (outcome.activityTypes)
        return kExitDone;
    if (outcome.closed)
        return kExitEditorEnded; // whoever interrupted us knows
    const std::string untouched = "; your recording is untouched: " + movie;
    if (outcome.error) {
        complain(outcome.error->description() + untouched);
        return kExitFailed;
    }
    complain("the editor ended early, " + outcome.end.words() + untouched);
    return kExitEditorEnded;
}

dbus::EditRequest requestFor(const OpenCommand& command)
{
    dbus::EditRequest request;
    request.moviePath = command.movie;
    request.appName = command.appName;
    request.bundleIdentifier = command.bundleId;
    request.attachmentPath = command.attachment;
    request.message = command.message;
    request.tint = command.tint;
    request.editorArguments = command.editorArguments;
    return request;
}

} // namespace

int openMovie(const OpenCommand& command)
{
    return openMovie(command, {});
}

int openMovie(const OpenCommand& command, OpenVariation variation)
{
    dbus::EditRequest request = requestFor(command);
    request.environment = std::move(variation.environment);
    if (const auto prepared = prepare(request); !prepared) {
        complain(prepared.error()->description());
        return kExitUsage;
    }
    const std::string movie = request.moviePath;
    const auto program = findEditorProgram();
    const auto root = editorDirectoriesRoot();
    if (!program || !root) {
        complain((program ? root.error() : program.error())->description());
        return kExitFailed;
    }

    std::unique_ptr<EditorSession> session;
    int interruptedBy = 0;
    const TerminationSignals signals([&](int number) {
        interruptedBy = number;
        session->close();
    });
    int status = kExitFailed;
    EditorSession::Handlers handlers;
    handlers.finished = std::move(variation.finished);
    if (!handlers.finished)
        handlers.finished = [&](const std::vector<std::string>& types) { print(types, command, movie); };
    handlers.copying = [&](std::uint64_t bytes) {
        complain("copying " + movie + " (" + std::to_string(bytes / 1'000'000)
                 + " MB), because the editor's directory is on another file system");
    };
    handlers.ended = [&](const EditorOutcome& outcome) {
        status = exitStatus(outcome, movie);
        QCoreApplication::exit();
    };
    auto started = EditorSession::start(std::move(request), {program.value(), root.value()}, std::move(handlers));
    if (!started) {
        complain(started.error()->description());
        return kExitFailed;
    }
    session = std::move(started).value();
    QCoreApplication::exec();
    return interruptedBy != 0 && status != kExitDone ? 128 + interruptedBy : status;
}

} // namespace host
