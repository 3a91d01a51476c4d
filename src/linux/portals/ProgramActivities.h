/// What other programs can do with a movie that are started for it, each an entry of the share sheet. Main queue only.
#pragma once

#include "linux/portals/Applications.h"
#include "linux/portals/ChildProgram.h"
#include "linux/portals/Portal.h"
#include "linux/sharing/OutboxActivity.h"
#include "platform/sharing/ActivityTypes.h"

#include <chrono>
#include <memory>
#include <string>

namespace portals {

/// A mail by xdg-email, where the desktop has no portal for it. It is completed when that says that it has been done; one
/// that says nothing for long may have started a mail program that still runs, and is left alone.
class MailProgramActivity final : public sharing::OutboxActivity {
public:
    static constexpr std::chrono::seconds kLimit{60};

    MailProgramActivity(const sharing::Environment& environment, std::string program)
        : OutboxActivity(environment, sharing::Outbox::Use::Read), m_program(std::move(program))
    {
    }
    std::string activityType() const override { return platform::kActivityTypeMail; }
    std::string activityTitle() const override { return environment().words.text("SHARE_MAIL"); }
    std::string glyph() const override { return "mail"; }

protected:
    void give() override;
    void stop() override;

private:
    void ended(int status);
    void fail(const char* key, const std::string& why);

    const std::string m_program;
    std::unique_ptr<ChildProgram> m_child;
};

/// A message by an application that says that it sends files. By the bus it is completed when the application has taken
/// them; a program when it has ended well, or runs on.
class MessageActivity final : public sharing::OutboxActivity {
public:
    static constexpr std::chrono::seconds kBusLimit{20};
    /// What is not there after it has failed by then.
    static constexpr std::chrono::seconds kProgramLimit{3};

    /// `isOnly`: there is no other to be told apart from.
    MessageActivity(const sharing::Environment& environment, std::shared_ptr<Portal> portal, Application application,
                    bool isOnly);

    std::string activityType() const override { return platform::kActivityTypeMessage; }
    std::string activityTitle() const override;
    std::string glyph() const override { return "message"; }
    std::string receiver() const override { return here(m_application).name; }

protected:
    bool takesOnlyTheMovie() const override { return !m_application.command.empty(); }
    void give() override;
    void stop() override;

private:
    void open(const QDBusConnection& bus);
    void refuse(const std::string& why);

    const std::shared_ptr<Portal> m_portal;
    const Application m_application;
    const bool m_isOnly;
    bus::Calls m_calls;
    std::unique_ptr<ChildProgram> m_child;
};

} // namespace portals
