/// A desktop as portal.py plays it, and what an activity works with on it. Time stands still. Main thread only.
#pragma once

#include "base/WorkList.h"
#include "linux/portals/DesktopActivities.h"
#include "support/Child.h"
#include "support/EnglishWords.h"
#include "support/EventLoop.h"
#include "support/FakeFileManager.h"
#include "support/Paths.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <QFile>
#include <QFileSystemWatcher>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

extern "C" char** environ;

namespace tests {

/// "Email=4 OpenURI=3 FileChooser=3", as of the portals of the day.
inline const std::vector<std::string> kWholePortal{"Email=4", "OpenURI=4", "FileChooser=4"};

class Desktop : public ::testing::Test {
protected:
    using Activities = std::vector<std::shared_ptr<platform::Activity>>;

    /// Starts what portal.py plays; what runs already ends.
    void start(const std::string& behaviour, const std::vector<std::string>& names = kWholePortal)
    {
        stop();
        // What it notes there wakes us.
        const QString notes = QString::fromStdString((directory.path() / "calls").native());
        if (m_notes.files().isEmpty()) {
            directory.write("calls", "");
            m_notes.addPath(notes);
        }
        std::vector<std::string> variables;
        for (char** each = environ; *each; ++each)
            variables.emplace_back(*each);
        std::vector<std::string> command{"/usr/bin/python3", sourceFile("tests/linux/portals/portal.py"),
                                         directory.path().native(), behaviour};
        command.insert(command.end(), names.begin(), names.end());
        m_desktop = std::make_unique<Child>(command, variables);
        ASSERT_TRUE(m_desktop->waitForText("ready")) << m_desktop->wait(Milliseconds(0)).err;
    }
    void stop()
    {
        if (!m_desktop)
            return;
        m_desktop->signal(SIGKILL);
        m_desktop->wait();
        m_desktop.reset();
    }

    void TearDown() override
    {
        activities.clear();
        provider.reset();
        stop();
    }

    /// Runs what there is to run until `holds`.
    bool pump(const std::function<bool()>& holds)
    {
        return pumpUntil(machine.mainQueue, [&] {
            machine.drain();
            return holds();
        });
    }

    /// Everything that can be done here with `items`.
    const Activities& find()
    {
        activities.clear();
        bool isOver = false;
        provider->findActivities(items, [&](Activities more, bool isLast) {
            activities.insert(activities.end(), more.begin(), more.end());
            isOver = isLast;
        });
        EXPECT_TRUE(pump([&] { return isOver; }));
        return activities;
    }
    std::vector<std::string> types()
    {
        std::vector<std::string> found;
        for (const auto& activity : find())
            found.push_back(activity->activityType());
        return found;
    }

    std::shared_ptr<platform::Activity> activityOf(const std::string& type)
    {
        for (const auto& activity : find())
            if (activity->activityType() == type)
                return activity;
        return nullptr;
    }

    void begin(const std::shared_ptr<platform::Activity>& activity)
    {
        end.reset();
        activity->setEndHandler([this](const platform::Activity::End& how) { end = how; });
        activity->setProgressHandler([this](std::optional<double> progress) { told.push_back(progress); });
        activity->prepareWithActivityItems(items);
        activity->performActivity();
    }
    /// How the activity of this type ends.
    platform::Activity::End perform(const std::string& type)
    {
        const auto activity = activityOf(type);
        if (!activity) {
            ADD_FAILURE() << type << " is not offered";
            return {};
        }
        begin(activity);
        EXPECT_TRUE(pump([&] { return end.has_value(); }));
        receiver = activity->receiver();
        return end.value_or(platform::Activity::End{});
    }
    void expectFailure(const platform::Activity::End& how, const std::string& key) const
    {
        EXPECT_FALSE(how.completed);
        ASSERT_TRUE(how.error) << "there is no error";
        EXPECT_EQ(how.error->userInfo().at(base::Error::kMessageKey), key) << how.error->description();
        EXPECT_NE(words.text(key), key) << "there are no words for it";
        EXPECT_THAT(platform::wordsFor(*how.error, words), testing::Not(testing::HasSubstr("{")));
    }

    /// What the desktop was asked, those of `member`.
    std::vector<QJsonObject> calls(const QString& member = {}) const
    {
        std::vector<QJsonObject> found;
        QFile file(QString::fromStdString((directory.path() / "calls").native()));
        if (!file.open(QIODevice::ReadOnly))
            return found;
        const QByteArray all = file.readAll();
        for (const QByteArray& line : all.left(all.lastIndexOf('\n') + 1).split('\n'))
            if (const QJsonObject call = QJsonDocument::fromJson(line).object();
                !line.isEmpty() && (member.isEmpty() || call["member"] == member))
                found.push_back(call);
        return found;
    }
    QJsonObject options(const QString& member) const
    {
        const auto found = calls(member);
        return found.empty() ? QJsonObject() : found.back()["arguments"].toArray().last().toObject();
    }
    /// What was in a descriptor that the desktop was given.
    std::string bytes(const QJsonValue& descriptor) const
    {
        return PrivateDirectory::read(directory.path() / descriptor.toObject()["bytes"].toString().toStdString());
    }

    std::size_t outboxSize() const
    {
        std::error_code error;
        const std::filesystem::directory_iterator entries(directory.path() / "outbox", error);
        return error ? 0
                     : static_cast<std::size_t>(
                         std::distance(std::filesystem::begin(entries), std::filesystem::end(entries)));
    }

    PrivateDirectory directory;
    TestSystem machine;
    EnglishWords words;
    FakeFileManager files{machine.system};
    base::WorkList works;
    sharing::Outbox outbox{directory.path() / "outbox"};
    sharing::Environment environment{machine.system, words, files, works, outbox, [this](const base::Url& file) {
                                         return file.path() == movie ? std::string("Tux Racer 2026-11-21.mp4")
                                                                     : file.lastPathComponent();
                                     }};

    std::string movieBytes = std::string(200'000, 'm') + "end";
    std::string movie = directory.write("store/movie.mp4", movieBytes);
    std::string attachment = directory.write("store/notes.txt", "notes");
    platform::ShareItems items{"Look at this", "https://example.org/tux", base::Url::fromPath(movie)};

    portals::ApplicationDirectories applications{
        {directory.path() / "config"}, {directory.path() / "data"}, {directory.path() / "bin"}};
    portals::DesktopActivities::Settings settings{bus::Bus::session(), [] { return std::string("x11:2a"); },
                                                  directory.path() / "Videos", [this] { return applications; }};
    std::unique_ptr<portals::DesktopActivities> provider =
        std::make_unique<portals::DesktopActivities>(environment, settings);

    Activities activities;
    std::optional<platform::Activity::End> end;
    std::vector<std::optional<double>> told;
    std::string receiver;

private:
    std::unique_ptr<Child> m_desktop;
    QFileSystemWatcher m_notes;
};

} // namespace tests
