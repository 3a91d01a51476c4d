// Sending by Bluetooth: how far it is, and all that can come between.
#include "Nearby.h"

#include <cstdlib>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::Optional;

namespace tests {

namespace {

const std::string kTablet = R"({
    "adapters": {"/org/bluez/hci0": {"Address": "00:00:5E:00:53:01", "Powered": true}},
    "devices": {"/org/bluez/hci0/dev_02": {"Address": "00:00:5E:00:53:02", "Alias": "Tablet", "Paired": true,
        "Adapter": "/org/bluez/hci0", "UUIDs": ["00001105-0000-1000-8000-00805f9b34fb"]}}})";

const std::string kBrokenOff =
    "“Tux Racer movie.mp4” did not reach “Tablet”. Keep the devices close together, accept the "
    "file there, and share again.";
const std::string kUnreached =
    "“Tablet” cannot be reached by Bluetooth. Bring it near, see that it is on, and share again.";
const std::string kNotRunning =
    "“Tux Racer movie.mp4” was not sent to “Tablet”, because Bluetooth is not running. Start "
    "it, and share again.";

} // namespace

class SendingByBluetooth : public Nearby {
protected:
    void serve(const std::string& more = {})
    {
        m_obexd = std::make_unique<Scripted>("obexd.py", m_session.address(), "{" + receiving(more) + "}");
        find();
    }
    bool hasSaid(const std::string& line)
    {
        return until([&] { return m_obexd->hasSaid(line); });
    }
    void startSending()
    {
        start();
        ASSERT_TRUE(hasSaid("sending Tux Racer movie.mp4")) << m_obexd->said();
    }
    bool hasTold(double progress)
    {
        return until([&] { return m_going.progress.back() == progress; });
    }

    Scripted m_bluez{"bluez.py", m_systemBus.address(), kTablet};
    std::unique_ptr<Scripted> m_obexd;
};

TEST_F(SendingByBluetooth, IsCompletedWhenTheDeviceHasAllOfIt)
{
    serve();
    startSending();
    EXPECT_FALSE(m_works.isEmpty()) << "the process must not end now";
    EXPECT_TRUE(m_obexd->hasSaid("session 00:00:5E:00:53:02 opp 00:00:5E:00:53:01"));
    EXPECT_THAT(m_going.progress, ElementsAre(std::nullopt)) << "the device's user may have to be asked";
    m_obexd->command("progress 75000");
    ASSERT_TRUE(hasTold(75'000.0 / 300'003));
    EXPECT_THAT(m_works.progress(), Optional(75'000.0 / 300'003));
    m_obexd->command("suspend");
    m_obexd->command("progress 150000");
    ASSERT_TRUE(hasTold(150'000.0 / 300'003));
    EXPECT_FALSE(m_going.end);
    m_obexd->command("progress 300003");
    ASSERT_TRUE(hasTold(1));
    EXPECT_FALSE(m_going.end) << "it has not said that it has it";
    m_obexd->command("complete");
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
    EXPECT_EQ(m_found[0]->receiver(), "Tablet");
    ASSERT_TRUE(hasSaid("session removed"));
    EXPECT_FALSE(m_obexd->hasSaid("cancelled"));
}

TEST_F(SendingByBluetooth, SendsOneFileAfterTheOtherInOneSession)
{
    m_items.emplace_back(base::Url::fromPath(m_directory.write("notes.txt", std::string(100'001, 'n'))));
    serve();
    startSending();
    m_obexd->command("complete");
    ASSERT_TRUE(hasSaid("sending Tux Racer notes.txt"));
    EXPECT_FALSE(m_going.end);
    m_obexd->command("progress 50000");
    ASSERT_TRUE(hasTold(350'003.0 / 400'004));
    m_obexd->command("complete");
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
    EXPECT_TRUE(isReceived("Tux Racer notes.txt", std::string(100'001, 'n')));
    EXPECT_THAT(m_obexd->said(), testing::Not(HasSubstr("session removed\nsession")));
}

TEST_F(SendingByBluetooth, NeverTellsMoreThanAll)
{
    serve();
    startSending();
    m_obexd->command("progress 9999999");
    ASSERT_TRUE(hasTold(1));
}

TEST_F(SendingByBluetooth, HearsOfAnEndThatComesBeforeTheAnswer)
{
    serve(R"(, "at once": true)");
    start();
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
}

TEST_F(SendingByBluetooth, DoesNotMindWhatOthersSend)
{
    serve();
    startSending();
    m_obexd->command("others");
    m_obexd->command("progress 300003");
    ASSERT_TRUE(hasTold(1));
    EXPECT_FALSE(m_going.end);
}

TEST_F(SendingByBluetooth, SaysThatTheDeviceCannotBeReached)
{
    serve(R"(, "refuses": "session")");
    start();
    expectFailure(kUnreached);
}

TEST_F(SendingByBluetooth, SaysThatTheDeviceDidNotTakeTheFile)
{
    serve(R"(, "refuses": "file")");
    start();
    expectFailure(kBrokenOff);
    ASSERT_TRUE(hasSaid("session removed"));
}

TEST_F(SendingByBluetooth, SaysThatTheTransferFailed)
{
    serve();
    startSending();
    m_obexd->command("progress 1000");
    m_obexd->command("error");
    expectFailure(kBrokenOff);
    ASSERT_TRUE(hasSaid("session removed"));
}

TEST_F(SendingByBluetooth, CanBeTriedAgain)
{
    m_items.emplace_back(base::Url::fromPath(m_directory.write("notes.txt", std::string(100'001, 'n'))));
    serve();
    startSending();
    m_obexd->command("complete");
    ASSERT_TRUE(hasSaid("sending Tux Racer notes.txt"));
    m_obexd->command("error");
    awaitEnd();
    start();
    ASSERT_TRUE(hasSaid("sending Tux Racer notes.txt\nsession removed\nsession 00:00:5E:00:53:02 opp "
                        "00:00:5E:00:53:01\nsending Tux Racer movie.mp4"));
    m_obexd->command("progress 100000");
    ASSERT_TRUE(hasTold(100'000.0 / 400'004));
}

TEST_F(SendingByBluetooth, SaysThatTheTransferVanished)
{
    serve();
    startSending();
    m_obexd->command("vanish");
    expectFailure(kBrokenOff);
}

TEST_F(SendingByBluetooth, SaysThatTheSessionVanished)
{
    serve();
    startSending();
    m_obexd->command("hangup");
    expectFailure(kBrokenOff);
}

TEST_F(SendingByBluetooth, SaysThatTheServiceWasKilled)
{
    serve();
    startSending();
    m_obexd->kill();
    expectFailure(kNotRunning);
}

TEST_F(SendingByBluetooth, SaysSoWhenTheBusEndsAndNobodyIsToldWhoLeft)
{
    serve();
    startSending();
    m_session.end();
    expectFailure(kNotRunning);
}

TEST_F(SendingByBluetooth, SaysThatTheServiceIsNotThereAnyMore)
{
    serve();
    m_obexd->kill();
    start();
    expectFailure(kNotRunning);
}

TEST_F(SendingByBluetooth, WaitsHalfAMinuteForTheDeviceToAnswer)
{
    serve(R"(, "holds": "CreateSession")");
    start();
    ASSERT_TRUE(hasSaid("holds CreateSession"));
    m_system.advance(std::chrono::milliseconds(29'999));
    EXPECT_FALSE(m_going.end);
    m_system.advance(std::chrono::seconds(1));
    expectFailure(kUnreached);
    m_found.clear();
    m_obexd->command("answer");
    ASSERT_TRUE(hasSaid("session removed")) << "nobody has use for it any more";
    EXPECT_FALSE(m_obexd->hasSaid("sending Tux Racer movie.mp4"));
}

TEST_F(SendingByBluetooth, IsCancelledInTheMiddle)
{
    serve();
    startSending();
    m_obexd->command("progress 1000");
    ASSERT_TRUE(hasTold(1000.0 / 300'003));
    m_found.front()->cancel();
    ASSERT_TRUE(m_going.end);
    EXPECT_FALSE(m_going.end->completed);
    EXPECT_FALSE(m_going.end->error);
    EXPECT_TRUE(m_works.isEmpty());
    ASSERT_TRUE(hasSaid("cancelled"));
    ASSERT_TRUE(hasSaid("session removed"));
}

TEST_F(SendingByBluetooth, IsCancelledWhileTheDeviceIsLookedFor)
{
    serve(R"(, "holds": "CreateSession")");
    start();
    ASSERT_TRUE(hasSaid("holds CreateSession"));
    m_found.front()->cancel();
    ASSERT_TRUE(m_going.end);
    EXPECT_FALSE(m_going.end->completed);
    m_obexd->command("answer");
    ASSERT_TRUE(hasSaid("session removed"));
}

TEST_F(SendingByBluetooth, IsGivenUpByWhoLetsGoOfIt)
{
    serve();
    startSending();
    m_obexd->command("progress 1000");
    ASSERT_TRUE(hasTold(1000.0 / 300'003));
    m_found.clear();
    EXPECT_TRUE(m_works.isEmpty());
    ASSERT_TRUE(hasSaid("cancelled"));
    ASSERT_TRUE(hasSaid("session removed"));
    EXPECT_FALSE(m_going.end);
}

TEST_F(SendingByBluetooth, CanBeLetGoOfByWhoHearsOfItsEnd)
{
    serve();
    startSending();
    m_found.front()->setEndHandler([this](const platform::Activity::End& end) {
        m_going.end = end;
        m_found.clear();
    });
    m_obexd->command("error");
    awaitEnd();
    EXPECT_FALSE(m_going.end->completed);
}

/// A bus that can start the service.
class StartingTheObexService : public SendingByBluetooth {
protected:
    void install(const std::string& execution)
    {
        m_directory.write("share/dbus-1/services/org.bluez.obex.service",
                          "[D-BUS Service]\nName=org.bluez.obex\nExec=" + execution + "\n");
        const char* const before = std::getenv("XDG_DATA_DIRS");
        const std::string former = before ? before : "";
        ::setenv("XDG_DATA_DIRS", (m_directory.path() / "share").c_str(), 1);
        m_other = std::make_unique<PrivateBus>(std::vector<const char*>());
        if (before)
            ::setenv("XDG_DATA_DIRS", former.c_str(), 1);
        else
            ::unsetenv("XDG_DATA_DIRS");
        m_provider = std::make_unique<devices::DeviceProvider>(
            m_environment, devices::DeviceProvider::Buses{to(*m_other), to(m_systemBus)});
    }

    std::unique_ptr<PrivateBus> m_other;
};

TEST_F(StartingTheObexService, IsDoneWhenTheUserWantsIt)
{
    const auto script =
        m_directory.write("obexd", "#!/bin/sh\nexec /usr/bin/python3 " + sourceFile("tests/linux/devices/obexd.py")
                                       + " \"$DBUS_STARTER_ADDRESS\" '{" + receiving(R"(, "at once": true)") + "}'\n");
    std::filesystem::permissions(script, std::filesystem::perms::owner_all);
    const auto started = m_directory.path() / "started";
    install("/bin/sh -c \"touch " + started.native() + "; exec " + script.native() + "\"");
    EXPECT_THAT(find(), ElementsAre("Tablet"));
    EXPECT_FALSE(std::filesystem::exists(started)) << "looking starts nothing";
    start();
    expectCompleted();
    EXPECT_TRUE(isReceived("Tux Racer movie.mp4", m_bytes));
}

TEST_F(StartingTheObexService, SaysThatItDoesNotStart)
{
    install("/bin/false");
    EXPECT_THAT(find(), ElementsAre("Tablet"));
    start();
    expectFailure(kNotRunning);
}

} // namespace tests
