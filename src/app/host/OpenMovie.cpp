#include "app/host/OpenMovie.h"

#include "app/host/EditorDirectory.h"
#include "app/host/EditorSession.h"
#include "app/host/JsonObject.h"
#include "app/host/PrepareRequest.h"
#include "app/host/Streams.h"
#include "app/host/TerminationSignals.h"
#include "linux/dbus/SessionResult.h"

#include <QCoreApplication>

#include <cstdio>
#include <utility>

namespace host {

namespace {

void printLines(const std::vector<std::string>& activityTypes)
{
    for (const std::string& type : activityTypes)
        std::printf("%s\n", type.c_str());
    std::fflush(stdout);
}

std::string objectOf(const dbus::SessionResult& result)
{
    JsonObject object;
    for (const auto& [name, text] : result)
        object.add(name, text);
    return object.text();
}

/// What became of what the user did.
struct Results {
    std::vector<std::string> saved;   ///< where movies are
    std::vector<std::string> unsaved; ///< where they are kept
    std::vector<std::string> objects; ///< of all results, in order
    bool isComplete = true;           ///< whether all that was to be saved was
};

void printObject(const EditorOutcome& outcome, Results results, const std::string& movie)
{
    JsonObject object;
    if (outcome.activityTypes)
        object.addTexts("activityTypes", *outcome.activityTypes);
    else
        results.objects.push_back(objectOf(dbus::resultOfFailure(outcome.failure())));
    object.add("movie", movie).addTexts("saved", results.saved).addTexts("unsaved", results.unsaved);
    object.addList("results", results.objects);
    std::puts(object.text().c_str());
}

void take(const dbus::MovieNote& note, Results& results)
{
    if (const auto result = dbus::resultOf(note); !result.empty())
        results.objects.push_back(objectOf(result));
    switch (note.kind) {
    case dbus::MovieNote::Kind::Saved:
        results.saved.push_back(note.path);
        break;
    case dbus::MovieNote::Kind::Unsaved:
        results.isComplete = false;
        if (note.path.empty()) {
            complain("the movie is not in your videos, and could not be kept elsewhere: " + note.why);
            break;
        }
        results.unsaved.push_back(note.path);
        complain("the movie is not in your videos; it is kept as " + note.path);
        break;
    case dbus::MovieNote::Kind::Refused: // the outcome has it
    case dbus::MovieNote::Kind::Shared:
    case dbus::MovieNote::Kind::Unshared: // which the user has read
        break;
    }
}

int exitStatus(const EditorOutcome& outcome, const Results& results, const std::string& movie)
{
    if (outcome.activityTypes)
        return results.isComplete ? kExitDone : kExitFailed;
    if (outcome.closed)
        return kExitEditorEnded; // whoever interrupted us knows
    if (outcome.error && outcome.error->domain() == dbus::kBadInputDomain)
        return kExitUsage; // the editor has said which file and why
    const std::string untouched = "; your recording is untouched: " + movie;
    if (outcome.error) {
        complain(outcome.error->description() + untouched);
        return kExitFailed;
    }
    complain(outcome.words() + untouched);
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

std::string wordsOfCopy(const std::string& movie, std::uint64_t bytes)
{
    return "copying " + movie + " (" + std::to_string(bytes / 1'000'000)
           + " MB), because the editor's directory is on another file system";
}

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
        handlers.finished = [&](const std::vector<std::string>& types) {
            if (!command.json)
                printLines(types);
        };
    Results results;
    handlers.noted = [&](const dbus::MovieNote& note) { take(note, results); };
    handlers.copying = [&](std::uint64_t bytes) { complain(wordsOfCopy(movie, bytes)); };
    handlers.ended = [&](const EditorOutcome& outcome) {
        // Only now it is known what became of a save that was under way when the user finished.
        if (command.json)
            printObject(outcome, results, movie);
        status = exitStatus(outcome, results, movie);
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
