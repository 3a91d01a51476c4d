/// A machine with buses of its own, on which scripted services know of devices.
#pragma once

#include "linux/devices/DeviceProvider.h"
#include "support/EnglishWords.h"
#include "support/EventLoop.h"
#include "support/FakeFileManager.h"
#include "support/PrivateBus.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <QDBusConnection>
#include <QProcess>

#include <csignal>
#include <gmock/gmock.h>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tests {

/// A service of this folder, driven by lines.
class Scripted {
public:
    Scripted(const std::string& program, const std::string& address, const std::string& script)
    {
        m_process.setProcessChannelMode(QProcess::ForwardedErrorChannel);
        m_process.start(QStringLiteral("/usr/bin/python3"),
                        {QString::fromStdString(sourceFile("tests/linux/devices/" + program)),
                         QString::fromStdString(address), QString::fromStdString(script)});
        EXPECT_TRUE(pumpUntil([this] { return hasSaid("ready"); })) << program;
    }
    ~Scripted() { kill(); }
    Scripted(const Scripted&) = delete;
    Scripted& operator=(const Scripted&) = delete;

    void command(const std::string& line) { m_process.write((line + "\n").c_str()); }
    bool hasSaid(const std::string& line)
    {
        m_said += m_process.readAllStandardOutput().toStdString();
        return ("\n" + m_said).find("\n" + line + "\n") != std::string::npos;
    }
    const std::string& said() const { return m_said; }
    /// It is there, and answers nobody.
    void freeze() { ::kill(static_cast<pid_t>(m_process.processId()), SIGSTOP); }
    void thaw() { ::kill(static_cast<pid_t>(m_process.processId()), SIGCONT); }
    void kill()
    {
        m_process.kill();
        m_process.waitForFinished();
    }

private:
    QProcess m_process;
    std::string m_said;
};

/// How an activity goes.
struct Going {
    std::vector<std::optional<double>> progress;
    std::optional<platform::Activity::End> end;
};

class Nearby : public ::testing::Test {
protected:
    using Activities = std::vector<std::shared_ptr<platform::Activity>>;

    ~Nearby() override
    {
        m_provider.reset();
        for (const QString& name : m_connections)
            QDBusConnection::disconnectFromBus(name);
    }

    /// A bus of the test's own, as another connection each time.
    devices::Bus::Connect to(const PrivateBus& bus)
    {
        static int count = 0;
        const QString name = QStringLiteral("nearby-%1").arg(++count);
        m_connections.push_back(name);
        return [address = QString::fromStdString(bus.address()), name] {
            return QDBusConnection::connectToBus(address, name);
        };
    }

    /// Handles what comes until `holds`; workers run, but time stands still.
    bool until(const std::function<bool()>& holds)
    {
        return pumpUntil(m_system.mainQueue, [&] {
            m_system.drain();
            return holds();
        });
    }

    void begin()
    {
        m_provider->findActivities(m_items, [this](Activities found, bool isLast) {
            m_bunches.push_back(found.size());
            m_found.insert(m_found.end(), found.begin(), found.end());
            EXPECT_FALSE(m_isLast) << "there is more after the last";
            m_isLast = isLast;
        });
    }
    /// The titles of what there is.
    std::vector<std::string> find()
    {
        m_found.clear();
        m_isLast = false;
        begin();
        EXPECT_TRUE(until([this] { return m_isLast; }));
        return titles();
    }
    std::vector<std::string> titles() const
    {
        std::vector<std::string> titles;
        for (const auto& activity : m_found)
            titles.push_back(activity->activityTitle());
        return titles;
    }

    /// Performs the only thing that there is.
    void start()
    {
        ASSERT_EQ(m_found.size(), 1U);
        start(*m_found.front());
    }
    void start(platform::Activity& activity)
    {
        m_going = {};
        activity.setProgressHandler([this](std::optional<double> part) { m_going.progress.push_back(part); });
        activity.setEndHandler([this](const platform::Activity::End& end) { m_going.end = end; });
        ASSERT_TRUE(activity.canPerformWithActivityItems(m_items));
        activity.prepareWithActivityItems(m_items);
        EXPECT_EQ(activity.activityViewController(), nullptr);
        activity.performActivity();
    }
    void awaitEnd()
    {
        ASSERT_TRUE(until([this] { return m_going.end.has_value(); }));
        // The work is let go of behind that.
        EXPECT_TRUE(m_works.isEmpty());
    }
    void expectCompleted()
    {
        ASSERT_NO_FATAL_FAILURE(awaitEnd());
        EXPECT_TRUE(m_going.end->completed)
            << (m_going.end->error ? m_going.end->error->description() : "it was cancelled");
    }
    void expectFailure(const std::string& words)
    {
        ASSERT_NO_FATAL_FAILURE(awaitEnd());
        EXPECT_FALSE(m_going.end->completed);
        ASSERT_TRUE(m_going.end->error);
        EXPECT_EQ(platform::wordsFor(*m_going.end->error, m_words), words) << m_going.end->error->description();
    }
    /// Whether the other end has just these bytes under this name.
    bool isReceived(const std::string& name, const std::string& bytes) const
    {
        return PrivateDirectory::read(m_directory.path() / "received" / name) == bytes;
    }
    std::string receiving(const std::string& more = {}) const
    {
        std::filesystem::create_directories(m_directory.path() / "received");
        return R"("received": ")" + (m_directory.path() / "received").native() + "\"" + more;
    }

    TestSystem m_system;
    EnglishWords m_words;
    FakeFileManager m_files{m_system.system};
    base::WorkList m_works;
    PrivateDirectory m_directory;
    sharing::Outbox m_outbox{m_directory.path() / "outbox"};
    sharing::Environment m_environment{
        m_system.system, m_words,  m_files,
        m_works,         m_outbox, [](const base::Url& file) { return "Tux Racer " + file.lastPathComponent(); }};
    PrivateBus m_session{std::vector<const char*>()};
    PrivateBus m_systemBus{std::vector<const char*>()};
    std::vector<QString> m_connections;
    std::unique_ptr<devices::DeviceProvider> m_provider = std::make_unique<devices::DeviceProvider>(
        m_environment, devices::DeviceProvider::Buses{to(m_session), to(m_systemBus)});

    const std::string m_bytes = std::string(300'000, 'm') + "end";
    const std::string m_notes = "what was said";
    platform::ShareItems m_items = {"Look at this", base::Url::fromPath(m_directory.write("movie.mp4", m_bytes))};
    Activities m_found;
    std::vector<std::size_t> m_bunches;
    bool m_isLast = false;
    Going m_going;
};

} // namespace tests
