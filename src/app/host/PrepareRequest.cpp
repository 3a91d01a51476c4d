#include "app/host/PrepareRequest.h"

#include "app/host/InputFile.h"
#include "app/host/RequestText.h"

#include <array>
#include <cerrno>
#include <cstdlib>
#include <memory>
#include <string_view>
#include <unistd.h>

namespace host {

namespace {

std::string absolute(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> resolved(::realpath(path.c_str(), nullptr), &std::free);
    return resolved ? resolved.get() : path;
}

/// A name for a movie that came without one, with the extension that its first bytes ask for.
std::string nameFor(int movie)
{
    std::array<char, 64> bytes{};
    const ssize_t count = ::pread(movie, bytes.data(), bytes.size(), 0);
    const std::string_view start(bytes.data(), count > 0 ? static_cast<std::size_t>(count) : 0);
    if (!start.starts_with("\x1A\x45\xDF\xA3"))
        return "recording.mp4";
    return start.find("webm") != std::string_view::npos ? "recording.webm" : "recording.mkv";
}

/// The one answer to a path, whatever is there.
base::ErrorRef notToBeHad(const std::string& words, const std::string& untold)
{
    using base::Error;
    return std::make_shared<const Error>(dbus::kBadInputDomain, EACCES,
                                         Error::UserInfo{{Error::kDescriptionKey, words}, {dbus::kUntoldKey, untold}});
}

base::Result<void> openMovie(dbus::EditRequest& request, const Confinement& isConfined)
{
    if (request.movie)
        return checkInput(request.movie.get(), "the movie", Emptiness::Refused);
    auto movie = openInput(request.moviePath, Emptiness::Refused);
    if (!movie && request.asker && isConfined(*request.asker))
        return notToBeHad("the recording cannot be had by its path; call org.clipsa.Recorder1.Edit with an open file",
                          movie.error()->description());
    if (!movie)
        return movie.error();
    request.movie = std::move(movie).value();
    request.moviePath = absolute(request.moviePath);
    if (request.movieName.empty())
        request.movieName = request.moviePath;
    return {};
}

/// A path stays a path: whoever gets the file in the end may read it when we are gone.
base::Result<void> findAttachment(dbus::EditRequest& request)
{
    if (const auto checked = checkText(request.attachmentPath, "the path of the attachment"); !checked)
        return checked;
    if (const auto attachment = openInput(request.attachmentPath, Emptiness::Allowed); !attachment)
        return attachment.error();
    request.attachmentPath = absolute(request.attachmentPath);
    return checkText(request.attachmentPath, "the name of " + request.attachmentPath);
}

base::Result<void> openAttachment(dbus::EditRequest& request, const Confinement& isConfined)
{
    if (request.attachment) {
        request.attachmentName = safeFileName(request.attachmentName, "attachment");
        return checkInput(request.attachment.get(), "the attachment", Emptiness::Allowed);
    }
    if (request.attachmentPath.empty())
        return {};
    if (!request.asker)
        return findAttachment(request);
    // Not even looked for on behalf of those who may not have it: how long that takes would tell something, too.
    const auto found = isConfined(*request.asker)
                           ? base::Result<void>(base::Error::make(dbus::kBadInputDomain, EACCES, "for a sandbox"))
                           : findAttachment(request);
    if (found)
        return {};
    return notToBeHad("the file of the option \"attachment\" cannot be had by its path; give an open file",
                      found.error()->description());
}

} // namespace

base::Result<void> prepare(dbus::EditRequest& request)
{
    return prepare(request, [](const dbus::Asker& asker) { return dbus::isConfined(asker); });
}

base::Result<void> prepare(dbus::EditRequest& request, const Confinement& isConfined)
{
    const std::string message = request.message.value_or("");
    const std::pair<std::string_view, const char*> texts[] = {{request.appName, "the app's name"},
                                                              {request.bundleIdentifier, "the bundle identifier"},
                                                              {message, "the message"}};
    for (const auto& [text, what] : texts)
        if (const auto checked = checkText(text, what); !checked)
            return checked;
    if (const auto opened = openMovie(request, isConfined); !opened)
        return opened;
    if (const auto opened = openAttachment(request, isConfined); !opened)
        return opened;
    // Read only for a movie that came without a name.
    request.movieName = safeFileName(request.movieName, "");
    if (request.movieName.empty())
        request.movieName = nameFor(request.movie.get());
    request.appName = safeAppName(request.appName.empty() ? withoutExtension(request.movieName) : request.appName);
    if (request.bundleIdentifier.empty())
        request.bundleIdentifier = kUnknownBundleIdentifier;
    return {};
}

} // namespace host
