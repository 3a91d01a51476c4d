// The real editor with a host that takes its time to hand the recording over.
#include "app/host/EditorDirectory.h"
#include "app/host/EditorProcess.h"
#include "linux/dbus/HostConnection.h"
#include "support/EventLoop.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"

#include <gmock/gmock.h>

using testing::ElementsAre;
using testing::Eq;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;

namespace {

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
            {{"CLIPSA_SCRIPT", m_directory.write("script", script)},
             {"CLIPSA_REPORT", m_directory.path() / "report"},
             {"CLIPSA_PICTURES", m_directory.path()},
             {"HOME", m_directory.path()}},
            m_place->lock()};
        editor.arguments.insert(editor.arguments.end(), options.begin(), options.end());
        auto process = host::EditorProcess::start(editor, [this](host::ProcessEnd end) { m_end = end; });
        ASSERT_TRUE(process) << process.error()->description();
        m_process = std::move(process).value();
    }

    void handOver(const char* source = "clock.mp4")
    {
        const auto movie = std::filesystem::path(m_place->movieDirectory()) / "clock.mp4";
        std::filesystem::copy_file(tests::movie(source), movie);
        for (const auto& answer : m_waiting)
            answer(runtime::Value(host::kDeviceMovieDirectory + std::string("clock.mp4")));
    }
    std::string report() const { return tests::PrivateDirectory::read(m_directory.path() / "report"); }
    /// Once the script has got so far.
    bool pumpUntilReported(const std::string& line)
    {
        QTimer tick; // wakes the loop: a file tells nobody that it has grown
        tick.start(std::chrono::milliseconds(5));
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
        picture arrived.png
        tap Cancel)");
    ASSERT_TRUE(pumpUntilReported("waiting"));
    EXPECT_EQ(m_finished, std::nullopt);
    handOver();
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(report(), "waiting\nRacer 4.000 640x360 phone\n");
    EXPECT_THAT(m_finished, Optional(IsEmpty())) << "what was not done was told";
    EXPECT_EQ(m_end->exitStatus, 0);
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
        tap There is no movie in this file.
        picture refused.png
        tap Cancel)",
          {"--explain"});
    ASSERT_TRUE(pumpUntilReported("waiting"));
    handOver("not-a-movie.mp4");
    ASSERT_TRUE(pumpUntilEnd());
    EXPECT_EQ(m_end->exitStatus, 0);
    EXPECT_EQ(m_finished, std::nullopt);
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
