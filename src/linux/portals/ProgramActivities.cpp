#include "linux/portals/ProgramActivities.h"

#include "linux/portals/MailText.h"

#include <algorithm>
#include <utility>

namespace portals {

void MailProgramActivity::give()
{
    noteProgress(std::nullopt);
    std::vector<std::string> words{m_program, "--utf8", "--subject", mailSubject(title())};
    if (std::string body = mailBody(text()); !body.empty()) {
        words.emplace_back("--body");
        words.push_back(std::move(body));
    }
    for (const auto& file : files()) {
        words.emplace_back("--attach");
        words.push_back(file->path());
    }
    base::MainQueue& queue = environment().system.mainQueue;
    m_child = std::make_unique<ChildProgram>(queue, std::move(words), [this](int status) { ended(status); });
    queue.postAfter(kLimit, [weak = weakSelf<MailProgramActivity>(), turn = turn()] {
        if (const auto self = weak.lock(); self && self->isUnderWay(turn)) {
            self->m_child.reset();
            self->fail("SHARE_MAIL_SILENT", "xdg-email is still running");
        }
    });
}

void MailProgramActivity::ended(int status)
{
    const auto child = std::move(m_child);
    if (status == 0)
        complete();
    else
        fail("SHARE_MAIL_REFUSED", status == ChildProgram::kNotStarted ? std::string("xdg-email cannot be started")
                                                                       : "xdg-email gives " + std::to_string(status));
}

void MailProgramActivity::fail(const char* key, const std::string& why)
{
    OutboxActivity::fail(base::Error::withMessage(base::Error::make("org.clipsa.portals", 1, why), key, {}));
}

void MailProgramActivity::stop()
{
    if (m_child)
        m_child->terminate();
    m_child.reset();
}

MessageActivity::MessageActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal,
                                 Application application, bool isOnly)
    : OutboxActivity(environment, sharing::Outbox::Use::Read), m_portal(std::move(portal)),
      m_application(std::move(application)), m_isOnly(isOnly), m_calls(environment.system.mainQueue)
{
}

std::string MessageActivity::activityTitle() const
{
    assertHere();
    const platform::MessageCatalog& words = environment().words;
    return m_isOnly ? words.text("SHARE_MESSAGE")
                    : words.text("SHARE_MESSAGE_WITH", {{"application", m_application.name}});
}

void MessageActivity::give()
{
    noteProgress(std::nullopt);
    if (m_application.command.empty()) {
        m_portal->bus().use([this, weak = weak_from_this(), turn = turn()](const QDBusConnection& bus) {
            if (const auto self = weak.lock(); self && isUnderWay(turn))
                open(bus);
        });
        return;
    }
    base::MainQueue& queue = environment().system.mainQueue;
    m_child =
        std::make_unique<ChildProgram>(queue, commandFor(m_application, files().front()->path()), [this](int status) {
            const auto child = std::move(m_child);
            if (status == 0)
                complete();
            else
                refuse("it has ended with " + std::to_string(status));
        });
    queue.postAfter(kProgramLimit, [weak = weakSelf<MessageActivity>(), turn = turn()] {
        if (const auto self = weak.lock(); self && self->isUnderWay(turn)) {
            self->m_child.reset();
            self->complete();
        }
    });
}

void MessageActivity::open(const QDBusConnection& bus)
{
    QString path = QLatin1Char('/') + QString::fromStdString(m_application.identifier);
    path.replace(QLatin1Char('.'), QLatin1Char('/')).replace(QLatin1Char('-'), QLatin1Char('_'));
    QStringList uris;
    for (const auto& file : files())
        uris.append(QString::fromStdString(base::Url::fromPath(file->path()).string()));
    QVariantMap more;
    if (const std::string body = mailBody(text()); !body.empty())
        more.insert(QStringLiteral("org.clipsa.text"), QString::fromStdString(body));
    auto call = bus::question(QString::fromStdString(m_application.identifier), path, "org.freedesktop.Application",
                              "Open", {uris, more});
    call.setAutoStartService(true);
    m_calls.ask(bus, call, kBusLimit, [this](const QDBusMessage& reply) {
        if (reply.type() == QDBusMessage::ReplyMessage)
            complete();
        else
            refuse((reply.errorName() + QStringLiteral(": ") + reply.errorMessage()).toStdString());
    });
}

void MessageActivity::refuse(const std::string& why)
{
    fail(base::Error::withMessage(base::Error::make("org.clipsa.portals", 1, why), "SHARE_MESSAGE_REFUSED",
                                  {{"application", m_application.name}}));
}

void MessageActivity::stop()
{
    m_calls.forget();
    if (m_child)
        m_child->terminate();
    m_child.reset();
}

} // namespace portals
