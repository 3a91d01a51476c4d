// Which devices are offered, by which names, and when.
#include "Nearby.h"

#include "platform/sharing/ActivityTypes.h"

#include <cstdlib>

using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

namespace tests {

namespace {

const std::string kPhone =
    R"({"devices": {"p1": {"name": "Phone", "type": "phone", "isReachable": true, "isPaired": true,
                                                  "plugins": ["kdeconnect_share"]}}})";
const std::string kAdapter = R"("/org/bluez/hci0": {"Address": "00:00:5E:00:53:01", "Powered": true})";

std::string bluetoothDevice(const std::string& number, const std::string& name, const std::string& more = "")
{
    return "\"/org/bluez/hci0/dev_" + number + R"(": {"Address": "00:00:5E:00:53:)" + number + R"(", "Alias": ")" + name
           + R"(", "Paired": true, "Adapter": "/org/bluez/hci0",
                "UUIDs": ["0000110a-0000-1000-8000-00805f9b34fb", "00001105-0000-1000-8000-00805F9B34FB"])"
           + more + "}";
}
std::string bluez(const std::string& devices, const std::string& adapters = kAdapter)
{
    return R"({"adapters": {)" + adapters + R"(}, "devices": {)" + devices + "}}";
}

} // namespace

class FindingDevices : public Nearby {};

TEST_F(FindingDevices, FindsNothingWhereNobodyIs)
{
    EXPECT_THAT(find(), IsEmpty());
    EXPECT_THAT(m_bunches, ElementsAre(0, 0, 0)) << "each service is told of";
}

TEST_F(FindingDevices, TellsNothingBeforeItReturnsAndNothingOnceItsProviderHasGone)
{
    begin();
    EXPECT_THAT(m_bunches, IsEmpty());
    m_provider = std::make_unique<devices::DeviceProvider>(
        m_environment, devices::DeviceProvider::Buses{to(m_session), to(m_systemBus)});
    m_system.advance(std::chrono::minutes(1));
    EXPECT_THAT(find(), IsEmpty());
    EXPECT_EQ(m_bunches.size(), 3U) << "those of the second";
}

TEST_F(FindingDevices, OffersNothingWhereThereIsNoFile)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(), kPhone);
    m_items = {"only words"};
    EXPECT_THAT(find(), IsEmpty());
    EXPECT_FALSE(kdeConnect.hasSaid("devices True True"));
}

TEST_F(FindingDevices, FindsNothingWhereThereIsNoBus)
{
    const auto nowhere = [] {
        return QDBusConnection::connectToBus(QStringLiteral("unix:path=/nowhere"), QStringLiteral("nearby-nowhere"));
    };
    m_provider =
        std::make_unique<devices::DeviceProvider>(m_environment, devices::DeviceProvider::Buses{nowhere, nowhere});
    EXPECT_THAT(find(), IsEmpty());
}

TEST_F(FindingDevices, DoesNotWaitForABusThatLetsNobodyIn)
{
    // It lets us in when the test is over: connecting cannot be given up.
    auto gate = std::make_shared<std::promise<void>>();
    m_provider = std::make_unique<devices::DeviceProvider>(
        m_environment, devices::DeviceProvider::Buses{to(m_session), [gate, connect = to(m_systemBus)] {
                                                          gate->get_future().wait();
                                                          return connect();
                                                      }});
    Scripted kdeConnect("kdeconnect.py", m_session.address(), kPhone);
    begin();
    ASSERT_TRUE(until([this] { return !m_found.empty(); }));
    EXPECT_FALSE(m_isLast);
    m_system.advance(std::chrono::milliseconds(1'999));
    EXPECT_FALSE(m_isLast);
    m_system.advance(std::chrono::milliseconds(1));
    EXPECT_TRUE(m_isLast);
    EXPECT_THAT(titles(), ElementsAre("Phone"));
    gate->set_value();
}

TEST_F(FindingDevices, OffersWhatKdeConnectReachesIsPairedWithAndCanShareWith)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(), R"({"devices": {
        "p1": {"name": "Phone", "type": "phone", "isReachable": true, "isPaired": true, "plugins": ["kdeconnect_share"]},
        "p2": {"name": "Older daemon", "type": "phone", "isReachable": true, "isTrusted": true,
               "plugins": ["kdeconnect_ping", "kdeconnect_share"]},
        "p3": {"name": "Away", "type": "phone", "isReachable": false, "isPaired": true, "plugins": ["kdeconnect_share"]},
        "p4": {"name": "Stranger", "type": "phone", "isReachable": true, "isPaired": false,
               "plugins": ["kdeconnect_share"]},
        "p5": {"name": "Stranger too", "type": "phone", "isReachable": true, "isTrusted": false,
               "plugins": ["kdeconnect_share"]},
        "p6": {"name": "Takes none", "type": "phone", "isReachable": true, "isPaired": true,
               "plugins": ["kdeconnect_ping"]}}})");
    EXPECT_THAT(find(), ElementsAre("Older daemon", "Phone"));
    EXPECT_TRUE(kdeConnect.hasSaid("devices True True"));
    EXPECT_EQ(m_found[0]->activityType(), platform::kActivityTypeKdeConnect);
    EXPECT_EQ(m_found[0]->receiver(), "Older daemon");
    EXPECT_EQ(m_found[0]->glyph(), "device");
    EXPECT_FALSE(m_found[0]->canPerformWithActivityItems({"only words"}));
}

TEST_F(FindingDevices, OffersWhatGsConnectIsConnectedToIsPairedWithAndCanShareWith)
{
    Scripted gsConnect("gsconnect.py", m_session.address(), R"({"devices": {
        "p1": {"Name": "Phone", "Connected": true, "Paired": true, "sharing": true},
        "p2": {"Name": "Away", "Connected": false, "Paired": true, "sharing": true},
        "p3": {"Name": "Stranger", "Connected": true, "Paired": false, "sharing": true},
        "p4": {"Name": "Not now", "Connected": true, "Paired": true, "sharing": false},
        "p5": {"Name": "Takes none", "Connected": true, "Paired": true},
        "p6": {"Name": "Takes something else", "Connected": true, "Paired": true, "sharing": true, "type": "s"}}})");
    EXPECT_THAT(find(), ElementsAre("Phone"));
    EXPECT_EQ(m_found[0]->activityType(), platform::kActivityTypeGsConnect);
    EXPECT_EQ(m_found[0]->receiver(), "Phone");
}

TEST_F(FindingDevices, OffersPairedBluetoothDevicesThatTakeFiles)
{
    Scripted obexd("obexd.py", m_session.address(), "{}");
    Scripted daemon(
        "bluez.py", m_systemBus.address(),
        bluez(bluetoothDevice("02", "Tablet") + "," + bluetoothDevice("03", "Blocked", R"(, "Blocked": true)") + ","
              + bluetoothDevice("04", "Stranger", R"(, "Paired": false)") + ","
              + bluetoothDevice("05", "Headphones", R"(, "UUIDs": ["0000110b-0000-1000-8000-00805f9b34fb"])") + ","
              + bluetoothDevice("06", "", R"(, "Name": "Without alias")") + ","
              + bluetoothDevice("07", "Of no adapter", R"(, "Adapter": "/org/bluez/hci9")")));
    EXPECT_THAT(find(), ElementsAre("Tablet", "Without alias"));
    EXPECT_EQ(m_found[0]->activityType(), platform::kActivityTypeBluetooth);
    EXPECT_EQ(m_found[0]->glyph(), "bluetooth");
}

TEST_F(FindingDevices, OffersADeviceOnceThatTwoAdaptersKnow)
{
    Scripted obexd("obexd.py", m_session.address(), "{}");
    Scripted daemon("bluez.py", m_systemBus.address(),
                    bluez(bluetoothDevice("02", "Tablet")
                              + R"(, "/org/bluez/hci1/dev_02": {"Address": "00:00:5E:00:53:02", "Alias": "Tablet",
                                     "Paired": true, "Adapter": "/org/bluez/hci1",
                                     "UUIDs": ["00001105-0000-1000-8000-00805f9b34fb"]})",
                          kAdapter + R"(, "/org/bluez/hci1": {"Address": "00:00:5E:00:53:10", "Powered": true})"));
    EXPECT_THAT(find(), ElementsAre("Tablet"));
}

TEST_F(FindingDevices, OffersNothingByBluetoothWhenNoAdapterIsOn)
{
    Scripted obexd("obexd.py", m_session.address(), "{}");
    {
        Scripted daemon("bluez.py", m_systemBus.address(),
                        bluez(bluetoothDevice("02", "Tablet"),
                              R"("/org/bluez/hci0": {"Address": "00:00:5E:00:53:01", "Powered": false})"));
        EXPECT_THAT(find(), IsEmpty());
    }
    Scripted daemon("bluez.py", m_systemBus.address(), bluez(bluetoothDevice("02", "Tablet"), ""));
    EXPECT_THAT(find(), IsEmpty());
}

TEST_F(FindingDevices, OffersNothingByBluetoothWhereNobodyCouldSend)
{
    Scripted daemon("bluez.py", m_systemBus.address(), bluez(bluetoothDevice("02", "Tablet")));
    EXPECT_THAT(find(), IsEmpty());
}

TEST_F(FindingDevices, WaitsTwoSecondsForAServiceThatDoesNotAnswer)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(), kPhone);
    Scripted gsConnect("gsconnect.py", m_session.address(), R"({"devices": {
        "p1": {"Name": "Other phone", "Connected": true, "Paired": true, "sharing": true}}})");
    Scripted obexd("obexd.py", m_session.address(), "{}");
    Scripted daemon("bluez.py", m_systemBus.address(), bluez(bluetoothDevice("02", "Tablet")));
    kdeConnect.freeze();
    daemon.freeze();

    begin();
    ASSERT_TRUE(until([this] { return !m_found.empty(); })) << "who answers is told at once";
    EXPECT_THAT(titles(), ElementsAre("Other phone"));
    m_system.advance(std::chrono::milliseconds(1'999));
    EXPECT_FALSE(m_isLast);
    m_system.advance(std::chrono::milliseconds(1));
    EXPECT_TRUE(m_isLast);
    EXPECT_THAT(titles(), ElementsAre("Other phone"));

    // Late answers change nothing, and the next time they are in time.
    kdeConnect.thaw();
    daemon.thaw();
    ASSERT_TRUE(until([&] { return kdeConnect.hasSaid("devices True True"); }));
    EXPECT_EQ(m_found.size(), 1U);
    EXPECT_THAT(find(), UnorderedElementsAre("Phone", "Other phone", "Tablet"));
}

TEST_F(FindingDevices, AsksAnewEachTime)
{
    EXPECT_THAT(find(), IsEmpty());
    Scripted kdeConnect("kdeconnect.py", m_session.address(), kPhone);
    EXPECT_THAT(find(), ElementsAre("Phone"));
    kdeConnect.kill();
    EXPECT_THAT(find(), IsEmpty());
}

TEST_F(FindingDevices, MakesHostileNamesHarmless)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(), R"({"devices": {
        "p1": {"name": "Ada\u202e\u0007\nenohP {name}", "type": "", "isReachable": true, "isPaired": true,
               "plugins": ["kdeconnect_share"]},
        "p2": {"name": "\u2066\u2069", "type": "", "isReachable": true, "isPaired": true,
               "plugins": ["kdeconnect_share"]}}})");
    EXPECT_THAT(find(), ElementsAre("Ada enohP {name}", "Unnamed device"));
}

TEST_F(FindingDevices, IsNotDisturbedByWhatIsListedAndNotThere)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(),
                        R"({"ghosts": ["", "no path!", "../..", "gone"], "devices": {
        "p1": {"name": "Phone", "type": "", "isReachable": true, "isPaired": true, "plugins": ["kdeconnect_share"]}}})");
    EXPECT_THAT(find(), ElementsAre("Phone"));
}

TEST_F(FindingDevices, TellsDevicesOfOneNameApartByTheWayToThem)
{
    Scripted kdeConnect("kdeconnect.py", m_session.address(), R"({"devices": {
        "p1": {"name": "Phone", "type": "", "isReachable": true, "isPaired": true, "plugins": ["kdeconnect_share"]},
        "p2": {"name": "Phone", "type": "", "isReachable": true, "isPaired": true, "plugins": ["kdeconnect_share"]},
        "p3": {"name": "Laptop", "type": "", "isReachable": true, "isPaired": true, "plugins": ["kdeconnect_share"]}}})");
    Scripted gsConnect("gsconnect.py", m_session.address(), R"({"devices": {
        "p1": {"Name": "Phone", "Connected": true, "Paired": true, "sharing": true}}})");
    Scripted obexd("obexd.py", m_session.address(), "{}");
    Scripted daemon("bluez.py", m_systemBus.address(), bluez(bluetoothDevice("02", "Laptop\u200F")));
    EXPECT_THAT(find(), UnorderedElementsAre("Laptop (KDE Connect)", "Phone (KDE Connect, 1)", "Phone (KDE Connect, 2)",
                                             "Phone (GSConnect)", "Laptop (Bluetooth)"));
    EXPECT_THAT(m_bunches, UnorderedElementsAre(3, 1, 1));
    for (const auto& activity : m_found)
        EXPECT_THAT(activity->receiver(), testing::AnyOf("Phone", "Laptop"));
}

TEST_F(FindingDevices, LeavesOutWhatNobodyHasSoMuchOf)
{
    std::string many;
    for (int i = 0; i < 120; ++i)
        many +=
            (many.empty() ? "" : ", ") + bluetoothDevice(std::to_string(100 + i), "Tablet " + std::to_string(100 + i));
    Scripted obexd("obexd.py", m_session.address(), "{}");
    Scripted daemon("bluez.py", m_systemBus.address(), bluez(many));
    EXPECT_EQ(find().size(), 50U);
}

} // namespace tests
