#include "linux/portals/DesktopActivities.h"

#include "linux/portals/FileActivities.h"
#include "linux/portals/ProgramActivities.h"

#include <algorithm>
#include <utility>

namespace portals {

namespace {

constexpr const char* kFileManager = "org.freedesktop.FileManager1";

/// What was found on a worker.
struct Programs {
    std::optional<std::string> mail;
    std::vector<Application> messages;
};

unsigned versionOf(const Portal::Versions& versions, const char* interface)
{
    const auto found = versions.find(interface);
    return found == versions.end() ? 0 : found->second;
}

} // namespace

/// One of them: three are asked at once, and each answer may bring some more.
struct DesktopActivities::Search : std::enable_shared_from_this<Search> {
    Search(const sharing::Environment& environment_, const Settings& settings_, std::shared_ptr<Portal> portal_,
           Found found_)
        : environment(environment_), settings(settings_), portal(std::move(portal_)), found(std::move(found_)),
          calls(environment.system.mainQueue)
    {
    }

    void begin()
    {
        portal->askVersions([weak = weak_from_this()](const Portal::Versions& answer) {
            if (const auto self = weak.lock()) {
                self->versions = answer;
                self->tell();
            }
        });
        askForFileManager();
        base::MainQueue& main = environment.system.mainQueue;
        environment.system.defaultQueue.post([weak = weak_from_this(), &main, applications = settings.applications] {
            const ApplicationDirectories directories = applications();
            Programs answer{mailProgram(directories), messageApplications(directories)};
            main.post([weak, answer = std::move(answer)]() mutable {
                if (const auto self = weak.lock(); self && !self->programs) {
                    self->programs = std::move(answer);
                    self->tell();
                }
            });
        });
        // A disk may be slow as well.
        main.postAfter(Portal::kVersionLimit, [weak = weak_from_this()] {
            if (const auto self = weak.lock()) {
                if (!self->programs)
                    self->programs.emplace();
                if (!self->hasFileManager)
                    self->hasFileManager = false;
                self->tell();
            }
        });
    }

    /// Whether there is one, or could be: it is not started by being asked.
    void askForFileManager()
    {
        portal->bus().use([weak = weak_from_this()](const QDBusConnection& connection) {
            const auto self = weak.lock();
            if (!self)
                return;
            if (!connection.isConnected()) {
                self->hasFileManager = false;
                self->tell();
                return;
            }
            const auto open = std::make_shared<int>(2);
            const auto answered = [search = self.get(), open](bool isThere) {
                if (--*open > 0 && !isThere)
                    return;
                if (!search->hasFileManager) {
                    search->hasFileManager = isThere;
                    search->tell();
                }
            };
            const auto limit = Portal::kVersionLimit;
            self->calls.ask(connection, bus::questionToBus("NameHasOwner", {QLatin1String(kFileManager)}), limit,
                            [answered](const QDBusMessage& reply) {
                                answered(bus::isReply(reply, "b") && reply.arguments().constFirst().toBool());
                            });
            self->calls.ask(
                connection, bus::questionToBus("ListActivatableNames", {}), limit,
                [answered](const QDBusMessage& reply) {
                    answered(bus::isReply(reply, "as")
                             && reply.arguments().constFirst().toStringList().contains(QLatin1String(kFileManager)));
                });
        });
    }

    /// What is known now and was not told before.
    void tell()
    {
        std::vector<std::shared_ptr<platform::Activity>> more;
        const bool hasPortal = versions.has_value();
        const unsigned openUri = hasPortal ? versionOf(*versions, kOpenUri) : 0;
        if (hasPortal && !std::exchange(isPortalTold, true)) {
            if (versionOf(*versions, kEmail) > 0)
                more.push_back(std::make_shared<MailActivity>(environment, portal));
            if (openUri >= kOpenFileVersion)
                more.push_back(std::make_shared<OpenWithActivity>(environment, portal));
            if (versionOf(*versions, kFileChooser) > 0)
                more.push_back(std::make_shared<SaveACopyActivity>(environment, portal, settings.folder));
            if (openUri >= kOpenDirectoryVersion)
                more.push_back(
                    std::make_shared<ShowInFolderActivity>(environment, portal, ShowInFolderActivity::Way::Portal));
        }
        if (programs && !std::exchange(areMessagesTold, true))
            for (const Application& application : programs->messages)
                more.push_back(std::make_shared<MessageActivity>(environment, portal, application,
                                                                 programs->messages.size() == 1));
        if (hasPortal && programs && !std::exchange(isMailProgramTold, true) && programs->mail
            && versionOf(*versions, kEmail) == 0)
            more.push_back(std::make_shared<MailProgramActivity>(environment, *programs->mail));
        if (hasPortal && hasFileManager && !std::exchange(isFileManagerTold, true) && *hasFileManager
            && openUri < kOpenDirectoryVersion)
            more.push_back(
                std::make_shared<ShowInFolderActivity>(environment, portal, ShowInFolderActivity::Way::FileManager));

        const bool isLast = isMailProgramTold && isFileManagerTold;
        if (!found || (more.empty() && !isLast))
            return;
        const Found tellThem = isLast ? std::exchange(found, {}) : found;
        tellThem(std::move(more), isLast);
    }

    const sharing::Environment& environment;
    const Settings settings;
    const std::shared_ptr<Portal> portal;
    Found found; ///< empty once the last has been told
    bus::Calls calls;

    // What has been answered.
    std::optional<Portal::Versions> versions;
    std::optional<bool> hasFileManager;
    std::optional<Programs> programs;

    bool isPortalTold = false;
    bool areMessagesTold = false;
    bool isMailProgramTold = false;
    bool isFileManagerTold = false;
};

DesktopActivities::DesktopActivities(const sharing::Environment& environment, Settings settings)
    : m_environment(environment), m_settings(std::move(settings)),
      m_portal(std::make_shared<Portal>(environment.system, m_settings.bus, m_settings.parentWindow))
{
}

DesktopActivities::~DesktopActivities() = default;

void DesktopActivities::findActivities(const platform::ShareItems& items, Found found)
{
    m_affinity.assertHere();
    std::erase_if(m_searches, [](const auto& search) { return !search->found; });
    auto offered = [items, found = std::move(found)](std::vector<std::shared_ptr<platform::Activity>> activities,
                                                     bool isLast) {
        std::erase_if(activities, [&](const auto& activity) { return !activity->canPerformWithActivityItems(items); });
        found(std::move(activities), isLast);
    };
    m_searches.push_back(std::make_shared<Search>(m_environment, m_settings, m_portal, std::move(offered)));
    // Later: a bus that is there already would answer before this returns.
    m_environment.system.mainQueue.post([weak = std::weak_ptr(m_searches.back())] {
        if (const auto search = weak.lock())
            search->begin();
    });
}

} // namespace portals
