#include "linux/portals/FileActivities.h"

#include "linux/portals/MailText.h"
#include "linux/posix/FileName.h"
#include "linux/sharing/SaveCopy.h"

#include <QDBusMetaType>
#include <QDBusUnixFileDescriptor>

#include <cerrno>
#include <fcntl.h>

namespace portals {

namespace {

constexpr const char* kFileManager = "org.freedesktop.FileManager1";
/// For a file manager to start and show the folder.
constexpr std::chrono::seconds kFileManagerLimit{20};

QVariant variantOf(const posix::FileDescriptor& file)
{
    return QVariant::fromValue(QDBusUnixFileDescriptor(file.get()));
}

/// Without waiting for whoever is at its other end, if it has one.
posix::FileDescriptor openToRead(const std::string& path)
{
    return posix::FileDescriptor(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
}

base::ErrorRef cannotOpen(const std::string& path)
{
    const std::string name = path.substr(path.rfind('/') + 1);
    return base::Error::withMessage(base::Error::fromErrno(errno, "cannot open " + path), "SHARE_FILE_GONE",
                                    {{"name", name}});
}

} // namespace

void MailActivity::give()
{
    qDBusRegisterMetaType<QList<QDBusUnixFileDescriptor>>();
    QList<QDBusUnixFileDescriptor> attachments;
    for (const auto& file : files()) {
        const posix::FileDescriptor open = file->openForReading();
        if (!open) {
            fail(cannotOpen(file->path()));
            return;
        }
        attachments.append(QDBusUnixFileDescriptor(open.get()));
    }
    QVariantMap options;
    options.insert(QStringLiteral("subject"), QString::fromStdString(mailSubject(title())));
    if (const std::string body = mailBody(text()); !body.empty())
        options.insert(QStringLiteral("body"), QString::fromStdString(body));
    options.insert(QStringLiteral("attachment_fds"), QVariant::fromValue(attachments));
    request({kEmail, "ComposeEmail", {}, options});
}

void OpenWithActivity::give()
{
    const std::string& path = files().front()->path();
    const posix::FileDescriptor open = files().front()->openForReading();
    if (!open)
        fail(cannotOpen(path));
    else
        request({kOpenUri, "OpenFile", {variantOf(open)}, {{QStringLiteral("ask"), true}}});
}

void SaveACopyActivity::give()
{
    m_movie = std::make_shared<posix::FileDescriptor>(openToRead(originals().front().path));
    if (!*m_movie) {
        fail(cannotOpen(originals().front().path));
        return;
    }
    QVariantMap options;
    options.insert(QStringLiteral("current_name"), QString::fromStdString(posix::wholeFileNameSafe(
                                                       originals().front().name, sharing::Outbox::kLongestName)));
    if (!m_folder.empty()) // with the zero byte at its end
        options.insert(QStringLiteral("current_folder"),
                       QByteArray(m_folder.c_str(), static_cast<qsizetype>(m_folder.size()) + 1));
    request({kFileChooser, "SaveFile", {QString::fromStdString(activityTitle())}, options});
}

void SaveACopyActivity::done(const QVariantMap& results)
{
    const QStringList uris = results.value(QStringLiteral("uris")).toStringList();
    const auto chosen = base::Url::fromString(uris.isEmpty() ? std::string() : uris.constFirst().toStdString());
    if (!chosen || !chosen->isFile() || !chosen->path().starts_with('/')) {
        fail(errorOf({PortalRequest::End::Refused, {}, "what was chosen is no file"}, "SHARE_SAVE_A_COPY_REFUSED",
                     activityTitle()));
        return;
    }
    m_path = chosen->path();
    workInBackground(
        [movie = m_movie, path = m_path](const std::function<bool(double)>& goOn) {
            return sharing::saveCopy(movie->get(), path, [&](std::uint64_t copied, std::uint64_t total) {
                return goOn(total > 0 ? static_cast<double>(copied) / static_cast<double>(total) : 1);
            });
        },
        [this] { complete(); });
}

ShowInFolderActivity::ShowInFolderActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal,
                                           Way way)
    : PortalActivity(environment, portal, sharing::Outbox::Use::Change, "SHARE_SHOW_IN_FOLDER_REFUSED"),
      m_portal(std::move(portal)), m_way(way), m_calls(environment.system.mainQueue)
{
}

void ShowInFolderActivity::prepareWithActivityItems(const platform::ShareItems& items)
{
    PortalActivity::prepareWithActivityItems(items);
    const auto movies = platform::filesOf(items);
    // What other programs know by another path than ours is the editor's.
    const bool isOwn =
        !movies.empty() && environment().files.resolvedPath(movies.front().path()) == movies.front().path();
    m_ownFile = isOwn ? movies.front().path() : std::string();
}

void ShowInFolderActivity::give()
{
    const std::string path = m_ownFile.empty() ? files().front()->path() : m_ownFile;
    if (m_way == Way::FileManager) {
        showInFileManager(path);
        return;
    }
    const posix::FileDescriptor open = openToRead(path);
    if (!open)
        fail(cannotOpen(path));
    else
        request({kOpenUri, "OpenDirectory", {variantOf(open)}, {}});
}

void ShowInFolderActivity::showInFileManager(const std::string& path)
{
    m_portal->bus().use([this, weak = weak_from_this(), turn = turn(), path](const QDBusConnection& bus) {
        const auto self = weak.lock();
        if (!self || !isUnderWay(turn))
            return;
        auto show = bus::question(QLatin1String(kFileManager), QStringLiteral("/org/freedesktop/FileManager1"),
                                  kFileManager, "ShowItems",
                                  {QStringList{QString::fromStdString(base::Url::fromPath(path).string())}, QString()});
        show.setAutoStartService(true);
        m_calls.ask(bus, show, kFileManagerLimit, [this](const QDBusMessage& reply) {
            if (reply.type() == QDBusMessage::ReplyMessage) {
                complete();
                return;
            }
            const bool isLate = reply.errorName() == QDBusError::errorString(QDBusError::TimedOut);
            fail(errorOf({isLate ? PortalRequest::End::NoAnswer : PortalRequest::End::Refused,
                          {},
                          (reply.errorName() + QStringLiteral(": ") + reply.errorMessage()).toStdString()},
                         "SHARE_SHOW_IN_FOLDER_REFUSED", activityTitle()));
        });
    });
}

void ShowInFolderActivity::stop()
{
    m_calls.forget();
    PortalActivity::stop();
}

} // namespace portals
