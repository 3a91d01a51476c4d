// The real editor with a host that takes its time to hand the recording over.
#include "app/host/EditorDirectory.h"
#include "app/host/EditorProcess.h"
#include "linux/dbus/HostConnection.h"
#include "support/EventLoop.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"
#include "support/Program.h"
#include "support/RefusedSystemCalls.h"

#include <QFileSystemWatcher>
#include <QImage>
#include <QRect>

#include <gmock/gmock.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Optional;

namespace {

/// How many pixels differ, which is the first, and where all of them lie, in words; empty when none does.
std::string placeOfDifference(const QImage& one, const QImage& other)
{
    if (one.size() != other.size())
        return "they differ in size";
    QRect place;
    std::string first;
    int count = 0;
    for (int y = 0; y < one.height(); ++y)
        for (int x = 0; x < one.width(); ++x) {
            if (one.pixel(x, y) == other.pixel(x, y))
                continue;
            std::ostringstream words;
            words << "the first at " << x << ", " << y << std::hex << " is " << one.pixel(x, y) << ", not "
                  << other.pixel(x, y);
            first = count++ == 0 ? words.str() : first;
            place |= QRect(x, y, 1, 1);
        }
    std::ostringstream words;
    words << count << " pixels, " << first << "; all in " << place.width() << " x " << place.height() << " at "
          << place.x() << ", " << place.y();
    return count == 0 ? "" : words.str();
}

class ASlowHandOver : public ::testing::Test {
protected:
    /// Starts an editor that is told all but where its movie is; `script` is what a person does to it.
    void start(const std::string& script, const std::vector<std::string>& options = {})
    {
        auto made = host::EditorDirectory::make(m_directory.path() / "clipsa");
        ASSERT_TRUE(made) << made.error()->description();
        m_place.emplace(std::move(made).value());
        std::vector<dbus::HostItem> items;
        items.push_back(
            {"VKVideoEditorExtensionAppNameKey", {dbus::HostAttachment::of(std::string("Racer"), "text/plain")}});
        items.push_back({"VKVideoEditorExtensionBundleIdentifierKey",
                         {dbus::HostAttachment::of(std::string("org.racer"), "text/plain")}});
        items.push_back({"VKVideoEditorExtensionMovieURLKey",
                         {{{platform::kGenericDataType},
                           [this](const dbus::LoadedItem& answer) { m_waiting.push_back(answer); }}}});
        auto listening = dbus::HostConnection::listen(m_place->socketPath().value(), std::move(items),
                                                      {.editorConnected = {},
                                                       .finished =
                                                           [this](std::vector<std::string> types) {
                                                               m_finished = std::move(types);
                                                               QMetaObject::invokeMethod(
                                                                   qApp, [this] { m_connection->disconnectEditor(); },
                                                                   Qt::QueuedConnection);
                                                           },
                                                       .disconnected = {}});
        ASSERT_TRUE(listening) << listening.error()->description();
        m_connection = std::move(listening).value();

        host::ProcessStart editor{
            tests::program("clipsa-editor"),
            {"--connect", m_connection->address(), "--device-root", m_place->deviceRoot(), "--device", "phone"},
            {},
            m_place->lock()};
        for (const auto& [name, value] : scripted(script))
            editor.environment.emplace_back(name, value);
        editor.arguments.insert(editor.arguments.end(), options.begin(), options.end());
        auto process = host::EditorProcess::start(editor, [this](host::ProcessEnd end) { m_end = end; });
        ASSERT_TRUE(process) << process.error()->description();
        m_process = std::move(process).value();
    }

    /// The environment of an editor to which this is done.
    tests::Program::Variables scripted(const std::string& script)
    {
        return {
            {"CLIPSA_EDITOR", tests::program("clipsa-editor")}, {"CLIPSA_SCRIPT", m_directory.write("script", script)},
            {"CLIPSA_REPORT", m_directory.path() / "report"},   {"CLIPSA_PICTURES", m_directory.path()},
            {"XDG_CACHE_HOME", m_directory.path() / "cache"},   {"HOME", m_directory.path()}};
    }

    void handOver(const char* source = "clock.mp4")
    {
        const auto movie = std::filesystem::path(m_place->movieDirectory()) / "clock.mp4";
        std::filesystem::copy_file(tests::movie(source), movie);
        // The title tells when it was made, to the minute: the earlier of when it was written and when the file came.
        std::filesystem::last_write_time(movie, std::chrono::file_clock::from_sys(std::chrono::sys_seconds{}));
        for (const auto& answer : m_waiting)
            answer(runtime::Value(host::kDeviceMovieDirectory + std::string("clock.mp4")));
    }
    QImage picture(const char* name) const
    {
        return QImage(QString::fromStdString(m_directory.path() / name)).convertToFormat(QImage::Format_RGB32);
    }
    std::string report() const { return tests::PrivateDirectory::read(m_directory.path() / "report"); }
    /// Once the script has got so far.
    bool pumpUntilReported(const std::string& line)
    {
        const std::filesystem::path file = m_directory.path() / "report";
        std::ofstream(file, std::ios::app).flush();                       // there may be none to be watched
        const QFileSystemWatcher watcher({QString::fromStdString(file)}); // wakes the loop when it grows
        return tests::pumpUntil([&] { return report().find(line + "\n") != std::string::npos || m_end; }) && !m_end;
    }
    bool pumpUntilEnd()
    {
        return tests::pumpUntil([&] { return m_end.has_value(); });
    }

    tests::PrivateDirectory m_directory;
    std::optional<host::EditorDirectory> m_place;
    std::vector<dbus::LoadedItem> m_waiting;
    std::unique_ptr<dbus::HostConnection> m_connection;
    std::unique_ptr<host::EditorProcess> m_process;
    std::optional<std::vector<std::string>> m_finished;
    std::optional<host::ProcessEnd> m_end;
};

TEST_F(ASlowHandOver, IsWaitedForInAWindowWithoutSave)
{
    start(R"(
        wait waiting
        size 390 760
        key return
        picture waiting.png
        print waiting
        wait picture
        print {title} {duration} {size} {layout}
        close)");
    ASSERT_TRUE(pumpUntilReported("waiting"));
    EXPECT_EQ(m_finished, std::nullopt);
    handOver();
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(report(), "waiting\nRacer 4.000 640x360 phone\n");
    EXPECT_THAT(m_finished, Optional(IsEmpty())) << "what was not done was told";
    EXPECT_EQ(m_end->exitStatus, 0);
}

TEST_F(ASlowHandOver, ShowsInTheEndWhatAQuickOneShows)
{
    const std::string rest = "wait picture\nwait ready\nwait frame 0\nwait thumbnails\nprint {date}\npicture ";
    start(rest + "quick.png\nkey escape");
    ASSERT_TRUE(tests::pumpUntil([&] { return !m_waiting.empty(); }));
    handOver();
    ASSERT_TRUE(pumpUntilEnd());
    m_end.reset();
    m_waiting.clear();
    start("wait waiting\nwait busy\npicture waiting.png\nprint waiting\n" + rest + "slow.png\nkey escape");
    ASSERT_TRUE(pumpUntilReported("waiting"));
    handOver();
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(report(), "January 1 12:00 AM\nwaiting\nJanuary 1 12:00 AM\n");
    EXPECT_THAT(m_finished, Optional(IsEmpty())) << "the editor has the keys";
    const QImage waiting = picture("waiting.png");
    int moving = 0;
    for (int x = 0; x < waiting.width(); ++x)
        moving += waiting.pixel(x, 0) != waiting.pixel(x, 20) ? 1 : 0;
    EXPECT_GT(moving, 0) << "the line of what is under way, at the edge of the bar";
    EXPECT_FALSE(picture("quick.png").isNull());
    EXPECT_EQ(placeOfDifference(picture("slow.png"), picture("quick.png")), "");
}

TEST_F(ASlowHandOver, FillsAWindowThatWasTurnedMeanwhile)
{
    start("wait waiting\nsize 844 390\nprint waiting\nwait picture\nwait ready\ntap 805 37"); // Save
    ASSERT_TRUE(pumpUntilReported("waiting"));
    handOver();
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_THAT(m_finished, Optional(ElementsAre("SaveToCameraRoll")));
}

TEST_F(ASlowHandOver, CanBeClosedAndNothingIsTold)
{
    for (const char* way : {"tap Cancel", "key escape", "close"}) {
        SCOPED_TRACE(way);
        m_finished.reset();
        m_end.reset();
        start(std::string("wait waiting\n") + way);
        ASSERT_TRUE(pumpUntilEnd());
        EXPECT_EQ(m_end->exitStatus, 0);
        EXPECT_EQ(m_finished, std::nullopt) << "a recorder would take it for a look at the movie";
    }
}

TEST_F(ASlowHandOver, OfWhatIsNoMovieIsExplainedWhereNobodyElseWill)
{
    start(R"(
        wait waiting
        print waiting
        tap “clock.mp4” is damaged, or is no movie
        print explained
        picture refused.png
        tap Cancel)",
          {"--explain"});
    ASSERT_TRUE(pumpUntilReported("waiting"));
    handOver("not-a-movie.mp4");
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(m_end->exitStatus, 0);
    EXPECT_EQ(m_finished, std::nullopt);
    EXPECT_EQ(report(), "waiting\nexplained\n");
}

TEST_F(ASlowHandOver, OfAMovieThatTakesLongToOpenIsWaitedForToo)
{
    std::unique_ptr<tests::Program> clipsa;
    posix::FileDescriptor heldUp;
    std::thread([&] {
        // The movie's packets; the dynamic loader's own reads are shorter.
        heldUp = posix::FileDescriptor(tests::holdUpSystemCalls({{SYS_pread64, tests::kHeldUp, 2, 0xFFFFFC00}}));
        clipsa = std::make_unique<tests::Program>(
            std::vector<std::string>{tests::program("clipsa"), "open", tests::movie("clock.mp4"), "--device", "phone"},
            scripted("wait waiting\ntap Waiting for the recording…\nprint waiting"));
    }).join();
    EXPECT_TRUE(pumpUntilReported("waiting"));
    heldUp = posix::FileDescriptor();
    clipsa->wait();
}

TEST_F(ASlowHandOver, ThatFailsShowsNoEditorOfNothing)
{
    start("wait waiting\ntap Cancel");
    ASSERT_TRUE(tests::pumpUntil([&] { return !m_waiting.empty(); }));
    m_waiting.front()(base::Error::make("posix", 28, "the disk is full"));
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(m_end->exitStatus, 0);
    EXPECT_EQ(m_finished, std::nullopt) << "a recorder would take it for a look at the movie";
}

TEST_F(ASlowHandOver, ThatEndsInNothingEndsTheEditor)
{
    start("wait waiting\nprint waiting");
    ASSERT_TRUE(pumpUntilReported("waiting"));
    m_connection->disconnectEditor();
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(m_end->exitStatus, 0);
}

} // namespace
