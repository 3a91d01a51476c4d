// What the bus tells of a caller, and what it comes to.
#include "linux/dbus/AskWho.h"

#include "Recorders.h"

#include <QDBusConnectionInterface>
#include <QDBusServer>

#include <gtest/gtest.h>

#include <csignal>
#include <sys/stat.h>
#include <sys/wait.h>

extern "C" {
#include <sys/pidfd.h> // glibc 2.36 forgets to say that these are C
}

namespace {

QVariantMap credentials(pid_t process, uint user = ::geteuid())
{
    return {{QStringLiteral("ProcessID"), static_cast<uint>(process)}, {QStringLiteral("UnixUserID"), user}};
}

/// The process that an asker is known to be; 0 for none.
bool isProcess(const dbus::Asker& asker, pid_t process)
{
    struct stat held = {};
    struct stat there = {};
    return asker.process && ::fstat(asker.process.get(), &held) == 0
           && ::stat(("/proc/" + std::to_string(process)).c_str(), &there) == 0 && held.st_ino == there.st_ino;
}

TEST(Credentials, NameTheProcessOfOurOwnUser)
{
    EXPECT_TRUE(isProcess(dbus::askerFrom(credentials(::getpid())), ::getpid()));
    EXPECT_TRUE(isProcess(dbus::askerFrom(credentials(::getppid())), ::getppid()));
}

TEST(Credentials, NameNobodyWhereTheBusDoesNotSay)
{
    EXPECT_FALSE(dbus::askerFrom({}).process);
    EXPECT_FALSE(dbus::askerFrom(credentials(::getpid(), ::geteuid() + 1)).process) << "another user";
    EXPECT_FALSE(dbus::askerFrom({{QStringLiteral("ProcessID"), static_cast<uint>(::getpid())}}).process);
    EXPECT_FALSE(dbus::askerFrom({{QStringLiteral("UnixUserID"), static_cast<uint>(::geteuid())}}).process);
    EXPECT_FALSE(dbus::askerFrom(credentials(0)).process);
    EXPECT_FALSE(dbus::askerFrom(credentials(-1)).process);
    EXPECT_FALSE(dbus::askerFrom(credentials(999'999'999)).process);
    auto words = credentials(::getpid());
    words[QStringLiteral("UnixUserID")] = QStringLiteral("me");
    EXPECT_FALSE(dbus::askerFrom(words).process);
}

TEST(Credentials, HaveALabelUpToItsZeroByte)
{
    auto labelled = credentials(::getpid());
    labelled[QStringLiteral("LinuxSecurityLabel")] = QByteArray("snap.racer.racer (enforce)\0", 27);
    EXPECT_EQ(dbus::askerFrom(labelled).securityLabel, "snap.racer.racer (enforce)");
    EXPECT_EQ(dbus::askerFrom(credentials(::getpid())).securityLabel, "");
}

TEST(Credentials, WithAProcessAreOfThatOneAlone)
{
    const pid_t child = ::fork();
    if (child == 0) {
        ::pause();
        ::_exit(0);
    }
    const posix::FileDescriptor process(::pidfd_open(child, 0));
    auto held = credentials(::getpid()); // as if its number had gone to us
    held[QStringLiteral("ProcessFD")] = QVariant::fromValue(QDBusUnixFileDescriptor(process.get()));
    EXPECT_TRUE(isProcess(dbus::askerFrom(held), child));

    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    EXPECT_FALSE(dbus::askerFrom(held).process) << "it has ended";

    const posix::FileDescriptor file(::open("/dev/null", O_RDONLY | O_CLOEXEC));
    held[QStringLiteral("ProcessFD")] = QVariant::fromValue(QDBusUnixFileDescriptor(file.get()));
    EXPECT_FALSE(dbus::askerFrom(held).process) << "it is no process";
}

class AskingWho : public ::testing::Test {
protected:
    /// The answer, when it has come.
    std::shared_ptr<const dbus::Asker> ask(const QDBusConnection& bus, const QString& name)
    {
        std::shared_ptr<const dbus::Asker> answer;
        int answers = 0;
        dbus::askWho(bus, name, m_context, [&](std::shared_ptr<const dbus::Asker> asker) {
            answer = std::move(asker);
            ++answers;
        });
        EXPECT_EQ(answers, 0) << "later";
        EXPECT_TRUE(tests::pumpUntil([&] { return answers == 1; }));
        EXPECT_TRUE(answer);
        return answer ? answer : std::make_shared<const dbus::Asker>();
    }

    QObject m_context;
};

TEST_F(AskingWho, IsAnsweredByARealBus)
{
    Caller caller;
    const auto asker = ask(caller.bus, caller.bus.baseService());
    EXPECT_TRUE(isProcess(*asker, ::getpid()));
    EXPECT_FALSE(dbus::isConfined(*asker));
}

TEST_F(AskingWho, IsOfNobodyWhoHasLeft)
{
    Caller caller;
    QString name;
    {
        const Caller other;
        name = other.bus.baseService();
    }
    EXPECT_FALSE(ask(caller.bus, name)->process);
}

/// A bus that says what a test says: each answer once, the last again and again. A list is all values of an answer, and
/// nothing ends the bus.
class BusOnPaper final : public QDBusVirtualObject {
public:
    BusOnPaper()
    {
        QObject::connect(&m_server, &QDBusServer::newConnection, this, [this](QDBusConnection connection) {
            connection.registerVirtualObject(QStringLiteral("/"), this, QDBusConnection::SubPath);
            m_connections.push_back(connection);
        });
        bus = QDBusConnection::connectToPeer(m_server.address(), QStringLiteral("paper"));
        EXPECT_TRUE(tests::pumpUntil([this] { return !m_connections.empty(); }));
    }
    ~BusOnPaper() override
    {
        end();
        QDBusConnection::disconnectFromPeer(QStringLiteral("paper"));
    }

    void end()
    {
        for (const QDBusConnection& connection : m_connections)
            QDBusConnection::disconnectFromPeer(connection.name());
        m_connections.clear();
    }

    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override
    {
        EXPECT_EQ(message.member().toStdString(), "GetConnectionCredentials");
        EXPECT_EQ(message.arguments(), QVariantList{QStringLiteral(":1.7")});
        const QVariant said = answers.at(std::min(m_said++, answers.size() - 1));
        if (said.isNull())
            end();
        else
            connection.send(said.metaType() == QMetaType::fromType<QVariantList>() ? message.createReply(said.toList())
                                                                                   : message.createReply(said));
        return true;
    }

    std::vector<QVariant> answers;
    QDBusConnection bus{QString()};

private:
    QDBusServer m_server{QStringLiteral("unix:tmpdir=/tmp")};
    std::vector<QDBusConnection> m_connections;
    std::size_t m_said = 0;
};

TEST_F(AskingWho, IsOfWhoeverHasTheNameAllTheTime)
{
    BusOnPaper paper;
    paper.answers = {credentials(::getpid())};
    EXPECT_TRUE(isProcess(*ask(paper.bus, QStringLiteral(":1.7")), ::getpid()));
}

TEST_F(AskingWho, IsOfNobodyWhenTheNameOrTheNumberIsAnothersMeanwhile)
{
    auto labelled = credentials(::getpid());
    labelled[QStringLiteral("LinuxSecurityLabel")] = QByteArray("snap.racer.racer (enforce)");
    for (const QVariantMap& then :
         {credentials(::getppid()), credentials(::getpid(), ::geteuid() + 1), labelled, QVariantMap()}) {
        BusOnPaper paper;
        paper.answers = {credentials(::getpid()), then};
        EXPECT_FALSE(ask(paper.bus, QStringLiteral(":1.7"))->process);
    }
}

TEST_F(AskingWho, IsOfNobodyWhereABusSaysSomethingElse)
{
    for (const QVariant& said : {QVariant(QStringLiteral("you know who")), QVariant(QVariantList())}) {
        BusOnPaper paper;
        paper.answers = {said};
        EXPECT_FALSE(ask(paper.bus, QStringLiteral(":1.7"))->process);
    }
}

TEST_F(AskingWho, IsAnsweredWhenTheBusEnds)
{
    for (const std::size_t after : {0U, 1U}) {
        BusOnPaper paper;
        paper.answers.resize(after, credentials(::getpid()));
        paper.answers.emplace_back();
        EXPECT_FALSE(ask(paper.bus, QStringLiteral(":1.7"))->process);
    }
}

} // namespace
