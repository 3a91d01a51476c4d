#include "app/host/ShareMovie.h"

#include "app/host/ExitStatus.h"
#include "app/host/InputFile.h"
#include "app/host/ProgressBar.h"
#include "app/host/Streams.h"
#include "app/host/TerminationSignals.h"
#include "app/sharing/ShareServices.h"
#include "linux/icu/Languages.h"
#include "linux/icu/MessageCatalog.h"
#include "linux/loop/MainLoop.h"
#include "linux/photos/VideoLibrary.h"
#include "linux/xdg/Bundles.h"
#include "linux/xdg/FileManager.h"
#include "linux/xdg/InstalledResources.h"
#include "platform/sharing/ActivityList.h"

#include <QCoreApplication>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <functional>
#include <memory>
#include <utility>
#include <vector>

namespace host {

namespace {

namespace fs = std::filesystem;

using Activities = std::vector<std::shared_ptr<platform::Activity>>;

/// What `--with` can be for `activity`: its type, with whom where there are several.
std::string nameOf(const platform::Activity& activity, const Activities& all)
{
    const std::string type = activity.activityType();
    const auto same =
        std::count_if(all.begin(), all.end(), [&](const auto& each) { return each->activityType() == type; });
    return same < 2 ? type : type + ":" + activity.activityTitle();
}

std::shared_ptr<platform::Activity> activityNamed(const std::string& name, const Activities& all)
{
    const auto found = std::find_if(all.begin(), all.end(), [&](const auto& each) {
        return nameOf(*each, all) == name || each->activityType() + ":" + each->activityTitle() == name;
    });
    return found == all.end() ? nullptr : *found;
}

/// The platform's roles for sharing, on this machine, and the loop that they work in.
struct Machine {
    base::SystemClock clock;
    base::StreamLog log{stderr, base::StreamLog::Style::Plain, false};
    base::MainQueue mainQueue{clock};
    loop::MainLoop loop{mainQueue};
    base::WorkerQueue background;
    base::WorkerQueue standard;
    base::System system{log, clock, mainQueue, background, standard};
    base::WorkList works;
    xdg::FileManager files{system, {}};
    intl::Languages languages;
    xdg::Bundles bundles{files, languages, xdg::BundlePlaces::ofUser()};
    intl::MessageCatalog words{bundles, xdg::wordsPath()};
    photos::VideoLibrary library{libraryOptions(), log, works};
    app::ShareServices services{{system,
                                 words,
                                 files,
                                 works,
                                 library,
                                 [](const base::Url& file) { return fs::path(file.path()).filename().native(); },
                                 {}}};

    static photos::LibraryOptions libraryOptions()
    {
        photos::LibraryOptions options;
        options.directories = photos::UserDirectories::ofUser();
        options.recording = [](const std::string& path) {
            return photos::Recording{fs::path(path).stem().native(), {}};
        };
        return options;
    }
};

/// One way from the question what there is to the end, on the main thread.
class Sharing {
public:
    Sharing(const ShareCommand& command, Machine& machine, const std::string& movie)
        : m_command(command), m_machine(machine)
    {
        if (!command.message.empty())
            m_items.emplace_back(command.message);
        m_items.emplace_back(base::Url::fromPath(movie));
        m_list = platform::ActivityList(m_items);
    }

    int run()
    {
        m_machine.services.activities().findActivities(m_items, [this](const Activities& activities, bool isLast) {
            m_list.add(activities);
            if (isLast)
                foundAll();
        });
        QCoreApplication::exec();
        m_bar.clear();
        return m_interruption != 0 && m_status != kExitDone ? 128 + m_interruption : m_status;
    }

    void interrupt(int number)
    {
        m_interruption = number;
        if (m_activity)
            m_activity->cancel();
        else
            leave(kExitFailed);
    }

private:
    void foundAll()
    {
        if (m_command.list) {
            for (const auto& each : m_list.activities())
                std::printf("%s\t%s\n", nameOf(*each, m_list.activities()).c_str(), each->activityTitle().c_str());
            leave(kExitDone);
            return;
        }
        m_activity = activityNamed(m_command.with, m_list.activities());
        if (!m_activity) {
            complain("nothing here shares by " + m_command.with + "; `clipsa share --list` says what does");
            leave(kExitFailed);
            return;
        }
        m_activity->setEndHandler([this](const platform::Activity::End& end) { ended(end); });
        m_activity->setProgressHandler([this](std::optional<double> progress) {
            if (progress)
                m_bar.show(*progress);
        });
        m_activity->prepareWithActivityItems(m_items);
        m_activity->performActivity();
    }

    void ended(const platform::Activity::End& end)
    {
        m_bar.clear();
        if (end.error)
            complain(platform::wordsFor(*end.error, m_machine.words)); // the log has the cause
        else if (!end.completed && m_interruption == 0)
            complain("it was cancelled");
        leave(end.completed ? kExitDone : end.error ? kExitFailed : kExitEditorEnded);
    }

    void leave(int status)
    {
        m_status = status;
        QCoreApplication::exit();
    }

    const ShareCommand& m_command;
    Machine& m_machine;
    platform::ShareItems m_items;
    platform::ActivityList m_list{{}};
    std::shared_ptr<platform::Activity> m_activity;
    ProgressBar m_bar{"Sharing"};
    int m_interruption = 0;
    int m_status = kExitFailed;
};

} // namespace

int shareMovie(const ShareCommand& command)
{
    if (const auto file = openInput(command.movie, Emptiness::Refused); !file) {
        complain(file.error()->description());
        return kExitUsage;
    }
    static char name[] = "clipsa";
    int argumentCount = 1;
    char* arguments[] = {name, nullptr};
    const QCoreApplication application(argumentCount, arguments);
    std::function<void(int number)> interrupt;
    const TerminationSignals signals([&interrupt](int number) { interrupt(number); });
    Machine machine;
    std::error_code ignored; // it could be opened a moment ago
    Sharing sharing(command, machine, fs::absolute(command.movie, ignored).native());
    interrupt = [&sharing](int number) { sharing.interrupt(number); };
    return sharing.run();
}

} // namespace host
