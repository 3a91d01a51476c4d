#include "app/host/OpenMovie.h"

#include "app/host/EditorDirectory.h"
#include "app/host/EditorSession.h"
#include "app/host/InputFile.h"
#include "app/host/RequestText.h"
#include "app/host/TerminationSignals.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <cstdio>
#include <cstdlib>
#include <memory>

namespace host {

namespace {

void complain(const std::string& text)
{
    std::fprintf(stderr, "clipsa: %s\n", text.c_str());
}

std::string absolute(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> resolved(::realpath(path.c_str(), nullptr), &std::free);
    return resolved ? resolved.get() : path;
}

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
    const std::string untouched = "; your recording is untouched: " + movie;
    if (outcome.error) {
        complain(outcome.error->description() + untouched);
        return kExitFailed;
    }
    complain("the editor ended early, " + outcome.end.words() + untouched);
    return kExitEditorEnded;
}

} // namespace

base::Result<OpenRequest> openRequest(const OpenCommand& command)
{
    OpenRequest open;
    auto movie = openInput(command.movie, Emptiness::Refused);
    if (!movie)
        return movie.error();
    open.movie = absolute(command.movie);
    dbus::EditRequest& request = open.request;
    request.movie = std::move(movie).value();
    request.movieName = safeFileName(open.movie, "recording.mp4");
    request.appName = safeAppName(command.appName.empty() ? withoutExtension(request.movieName) : command.appName);
    if (!command.bundleId.empty())
        request.bundleIdentifier = command.bundleId;
    if (!command.attachment.empty()) {
        const auto attachment = openInput(command.attachment, Emptiness::Allowed);
        if (!attachment)
            return attachment.error();
        request.attachmentPath = absolute(command.attachment);
        if (const auto checked = checkText(request.attachmentPath, "the name of " + request.attachmentPath); !checked)
            return checked.error();
    }
    request.message = command.message;
    request.tint = command.tint;
    request.editorArguments = command.editorArguments;
    return open;
}

int openMovie(const OpenCommand& command)
{
    auto open = openRequest(command);
    if (!open) {
        complain(open.error()->description());
        return kExitUsage;
    }
    const std::string movie = open.value().movie;
    const auto program = findEditorProgram();
    const auto root = editorDirectoriesRoot();
    if (!program || !root) {
        complain((program ? root.error() : program.error())->description());
        return kExitFailed;
    }

    int status = kExitFailed;
    EditorSession::Handlers handlers;
    handlers.finished = [&](const std::vector<std::string>& types) { print(types, command, movie); };
    handlers.copying = [&](std::uint64_t bytes) {
        complain("copying " + movie + " (" + std::to_string(bytes / 1'000'000)
                 + " MB), because the editor's directory is on another file system");
    };
    handlers.ended = [&](const EditorOutcome& outcome) {
        status = exitStatus(outcome, movie);
        QCoreApplication::exit();
    };
    auto session =
        EditorSession::start(std::move(open.value().request), {program.value(), root.value()}, std::move(handlers));
    if (!session) {
        complain(session.error()->description());
        return kExitFailed;
    }
    int interruptedBy = 0;
    const TerminationSignals signals([&](int number) {
        interruptedBy = number;
        session.value()->close();
    });
    QCoreApplication::exec();
    return interruptedBy != 0 && status != kExitDone ? 128 + interruptedBy : status;
}

} // namespace host
