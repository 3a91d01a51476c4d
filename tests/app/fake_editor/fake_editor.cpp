// An editor without a window, for tests of hosts: loads its payload, writes down what it got, and does what FAKE_EDITOR
// says, in order, words separated by spaces:
//   report=FILE        writes the payload's texts there, one "title=value" a line, then arguments; FILE appears
//                      complete
//   say=TEXT           prints TEXT
//   finish=A,B         tells the host that the user has finished, with these activity types ("finish=" with none)
//   exit=N   crash     ends at once
//   wait               waits until the host closes the connection, then goes on
//   tell=PIPE          writes the same into a named pipe, once somebody reads
//   remove-movie       removes the movie that was handed over, as saving does
//   saved=FILE unsaved=FILE   reports a movie that was saved, or could not be
//   shared=TYPE,RECEIVER unshared=TYPE,RECEIVER   reports that it was shared, or could not be
//   refuse             reports that what was handed over is no movie
//   busy               has something to finish from now on
//   leave              closes the connection
//   hang               stays, whatever the host does; only SIGKILL helps

#include "linux/dbus/BusyMark.h"
#include "linux/dbus/EditorReport.h"
#include "linux/dbus/ExtensionConnection.h"
#include "platform/views/Color.h"

#include <QCoreApplication>

#include <condition_variable>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <future>
#include <optional>
#include <sstream>
#include <string>
#include <unistd.h>

namespace {

/// A main queue without an event loop.
class Loop {
public:
    Loop()
    {
        m_queue.setWake([this] {
            const std::lock_guard lock(m_mutex);
            m_woken = true;
            m_changed.notify_all();
        });
    }

    base::MainQueue& queue() { return m_queue; }

    template <typename Predicate> void runUntil(Predicate&& predicate)
    {
        while (m_queue.drain(), !predicate()) {
            std::unique_lock lock(m_mutex);
            m_changed.wait(lock, [this] { return m_woken; });
            m_woken = false;
        }
    }

private:
    base::SystemClock m_clock;
    base::MainQueue m_queue{m_clock};
    std::mutex m_mutex;
    std::condition_variable m_changed;
    bool m_woken = false;
};

std::string loaded(const platform::InputItem& item)
{
    if (item.attachments.empty())
        return "(no attachment)";
    std::promise<std::string> promise;
    item.attachments.front()->loadItemForTypeIdentifier(
        platform::kGenericDataType, [&](const runtime::Value& value, const base::ErrorRef& error) {
            if (const auto* color = std::any_cast<platform::Color>(&value)) {
                std::ostringstream words;
                words << color->red << " " << color->green << " " << color->blue << " " << color->alpha;
                promise.set_value(words.str());
            } else {
                promise.set_value(error ? "error: " + error->description() : runtime::fromValue<std::string>(value));
            }
        });
    return promise.get_future().get();
}

std::vector<std::string> split(const std::string& text, char separator)
{
    std::vector<std::string> parts;
    std::istringstream stream(text);
    for (std::string part; std::getline(stream, part, separator);)
        parts.push_back(part);
    return parts;
}

std::string argument(int argc, char* argv[], const std::string& name)
{
    for (int i = 1; i + 1 < argc; ++i)
        if (argv[i] == name)
            return argv[i + 1];
    return {};
}

void writeWhole(const std::string& path, const std::string& text)
{
    const std::string early = path + ".new";
    std::ofstream(early) << text;
    std::rename(early.c_str(), path.c_str());
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    Loop loop;
    std::optional<dbus::ExtensionConnection> connection(std::in_place, loop.queue());
    connection->setHostInterface(
        {"VKVideoEditorExtensionHostProtocol", {runtime::Selector("extensionDidFinishWithActivityTypes:")}});
    if (const auto connected = connection->connect(argument(argc, argv, "--connect")); !connected) {
        std::fprintf(stderr, "fake editor: %s\n", connected.error()->description().c_str());
        return 70;
    }
    bool disconnected = false;
    connection->setDisconnectedHandler([&] { disconnected = true; });
    const auto items = connection->inputItems();
    if (!items)
        return 71;

    const std::string device = "/private/var/mobile/Library";
    std::string payload;
    std::string movie;
    for (const platform::InputItem& item : items.value()) {
        const std::string value = loaded(item);
        payload += item.attributedTitle + "=" + value + "\n";
        if (item.attributedTitle == "VKVideoEditorExtensionMovieURLKey" && value.starts_with(device))
            movie = argument(argc, argv, "--device-root") + value.substr(device.size());
    }
    for (int i = 1; i < argc; ++i)
        payload += std::string("argument=") + argv[i] + "\n";
    payload += "movie file=" + movie + "\n";

    const auto proxy = connection->remoteObjectProxyWithErrorHandler(
        [](const base::ErrorRef& error) { std::fprintf(stderr, "fake editor: %s\n", error->description().c_str()); });
    // Never destroyed: it stays busy until the kernel ends it, as sanitizers take their time on the way out.
    static auto& busy = *new dbus::BusyMark(argument(argc, argv, "--device-root"));
    dbus::EditorReport report(posix::FileDescriptor(std::stoi(argument(argc, argv, "--report"))));
    const char* const script = std::getenv("FAKE_EDITOR");
    for (const std::string& step : split(script ? script : "", ' ')) {
        const std::string word = step.substr(0, step.find('='));
        const std::string value = step.find('=') == std::string::npos ? "" : step.substr(step.find('=') + 1);
        if (word == "report") {
            writeWhole(value, payload);
        } else if (word == "tell") {
            std::ofstream(value) << payload;
        } else if (word == "say") {
            std::printf("%s\n", value.c_str());
            std::fflush(stdout);
        } else if (word == "finish") {
            proxy->send(runtime::Selector("extensionDidFinishWithActivityTypes:"),
                        {runtime::toValue(split(value, ','))});
        } else if (word == "wait") {
            loop.runUntil([&] { return disconnected; });
        } else if (word == "remove-movie") {
            ::unlink(movie.c_str());
        } else if (word == "exit") {
            connection->flush();
            std::_Exit(std::atoi(value.c_str()));
        } else if (word == "crash") {
            std::abort();
        } else if (word == "saved") {
            report.add({dbus::MovieNote::Kind::Saved, value, ""});
        } else if (word == "unsaved") {
            report.add({dbus::MovieNote::Kind::Unsaved, value, "the disk is full"});
        } else if (word == "shared" || word == "unshared") {
            const std::vector<std::string> parts = split(value + ",", ',');
            if (word == "shared")
                report.add({.kind = dbus::MovieNote::Kind::Shared, .type = parts.at(0), .receiver = parts.at(1)});
            else
                report.add({.kind = dbus::MovieNote::Kind::Unshared,
                            .why = "it went away",
                            .type = parts.at(0),
                            .receiver = parts.at(1)});
        } else if (word == "refuse") {
            report.add({dbus::MovieNote::Kind::Refused, "", "it is no movie"});
        } else if (word == "busy") {
            busy.set();
        } else if (word == "leave") {
            connection.reset();
        } else if (word == "hang") {
            std::signal(SIGTERM, SIG_IGN);
            for (;;)
                ::pause();
        }
    }
    return 0;
}
