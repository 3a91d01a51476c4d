#include "linux/xdg/DeviceProfile.h"

#include "linux/xdg/Chassis.h"
#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

namespace {

using platform::InterfaceIdiom;
using xdg::DeviceProfile;
using xdg::deviceValuesForChassis;

std::optional<InterfaceIdiom> idiomOf(std::string_view chassis, double windowWidth)
{
    return DeviceProfile(deviceValuesForChassis(chassis), [windowWidth] { return windowWidth; }).userInterfaceIdiom();
}

TEST(ADevice, IsAPhoneWhenItIsAHandsetHoweverWideItsWindow)
{
    EXPECT_EQ(idiomOf("handset", 360), InterfaceIdiom::Phone);
    EXPECT_EQ(idiomOf("handset", 1920), InterfaceIdiom::Phone);
}

TEST(ADevice, IsAPadWhenItIsATabletOrConvertibleHoweverNarrowItsWindow)
{
    for (const char* chassis : {"tablet", "convertible"}) {
        EXPECT_EQ(idiomOf(chassis, 400), InterfaceIdiom::Pad);
        EXPECT_EQ(idiomOf(chassis, 1920), InterfaceIdiom::Pad);
    }
}

TEST(ADevice, GoesByTheWidthOfItsWindowWhenItHasWindowsOfAnySize)
{
    for (const char* chassis : {"desktop", "laptop", "server", "", "toaster"}) {
        EXPECT_EQ(idiomOf(chassis, 599.5), InterfaceIdiom::Phone);
        EXPECT_EQ(idiomOf(chassis, 600), InterfaceIdiom::Pad);
        EXPECT_EQ(idiomOf(chassis, 1920), InterfaceIdiom::Pad);
    }
}

TEST(ADevice, ChangesItsIdiomWithItsWindow)
{
    double width = 1000;
    const DeviceProfile device(deviceValuesForChassis("desktop"), [&] { return width; });
    EXPECT_EQ(device.userInterfaceIdiom(), InterfaceIdiom::Pad);
    width = 400;
    EXPECT_EQ(device.userInterfaceIdiom(), InterfaceIdiom::Phone);
}

TEST(ADevice, WithoutAWindowIsWide)
{
    EXPECT_EQ(DeviceProfile(deviceValuesForChassis("desktop")).userInterfaceIdiom(), InterfaceIdiom::Pad);
}

TEST(ADevice, IsWhatItWasExplicitlyCalled)
{
    auto values = deviceValuesForChassis("handset");
    values.idiom = xdg::idiomNamed("pad");
    EXPECT_EQ(DeviceProfile(values).userInterfaceIdiom(), InterfaceIdiom::Pad);
    values = deviceValuesForChassis("desktop");
    values.idiom = xdg::idiomNamed("phone");
    EXPECT_EQ(DeviceProfile(values, [] { return 1920.0; }).userInterfaceIdiom(), InterfaceIdiom::Phone);
    EXPECT_EQ(xdg::idiomNamed("watch"), std::nullopt);
}

TEST(ADevice, HasAHomeButtonUnlessItIsSaidNotTo)
{
    auto values = deviceValuesForChassis("desktop");
    EXPECT_NE(DeviceProfile(values).integerAnswer(platform::kDeviceHomeButtonKey, 0), 2);
    values.hasHomeButton = false;
    EXPECT_EQ(DeviceProfile(values).integerAnswer(platform::kDeviceHomeButtonKey, 0), 2);
}

TEST(ADevice, AnswersNoOtherQuestionWithANumber)
{
    xdg::DeviceValues values;
    values.hasHomeButton = false;
    EXPECT_EQ(DeviceProfile(values).integerAnswer("another", 7), 7);
    EXPECT_EQ(DeviceProfile(values).integerAnswer("", -1), -1);
}

TEST(ADevice, AnswersBooleanQuestionsFromItsProfileAndOthersWithNo)
{
    xdg::DeviceValues values;
    EXPECT_TRUE(DeviceProfile(values).booleanAnswer("not-zorvane"));
    EXPECT_FALSE(DeviceProfile(values).booleanAnswer("another"));
    values.booleans = {{"not-zorvane", false}, {"another", true}};
    EXPECT_FALSE(DeviceProfile(values).booleanAnswer("not-zorvane"));
    EXPECT_TRUE(DeviceProfile(values).booleanAnswer("another"));
}

TEST(ADevice, CanAffordBlursUnlessItIsSaidNotTo)
{
    xdg::DeviceValues values;
    EXPECT_NE(DeviceProfile(values).graphicsQuality(), 10);
    values.graphicsQuality = 10;
    EXPECT_EQ(DeviceProfile(values).graphicsQuality(), 10);
}

class TheChassis : public testing::Test {
protected:
    tests::PrivateDirectory root;
    std::optional<std::string> chassis() const { return xdg::chassisFromMachineInfo(root.path()); }
    void writeMachineInfo(const std::string& text) const { root.write("etc/machine-info", text); }
    void writeFirmware(const std::string& text) const { root.write("sys/class/dmi/id/chassis_type", text); }
};

TEST_F(TheChassis, IsUnknownWhereNothingSaysIt)
{
    EXPECT_EQ(chassis(), std::nullopt);
}

TEST_F(TheChassis, IsWhatTheOwnerWroteWhateverTheFirmwareSays)
{
    writeFirmware("10\n");
    for (const char* text : {"CHASSIS=tablet\n", "CHASSIS=\"tablet\"", "# CHASSIS=server\n  CHASSIS='tablet' \r\n",
                             "CHASSIS=laptop\nPRETTY_HOSTNAME=x\nCHASSIS=tablet\n"}) {
        writeMachineInfo(text);
        EXPECT_EQ(chassis(), "tablet") << text;
    }
}

TEST_F(TheChassis, IsWhatTheFirmwareSaysWhereTheOwnerWroteNothing)
{
    const std::pair<const char*, const char*> kTypes[] = {
        {"3\n", "desktop"}, {"9\n", "laptop"},  {"10\n", "laptop"},     {"11\n", "handset"},
        {"23\n", "server"}, {"30\n", "tablet"}, {"31\n", "convertible"}};
    for (const char* text : {"", "PRETTY_HOSTNAME=x\n", "CHASSIS=\n", "CHASSIS=\"\"\n", "OLD_CHASSIS=server\n"}) {
        writeMachineInfo(text);
        for (const auto& [type, name] : kTypes) {
            writeFirmware(type);
            EXPECT_EQ(chassis(), name) << text << type;
        }
    }
}

TEST_F(TheChassis, IsUnknownWhenTheFirmwareTalksNonsense)
{
    for (const char* text : {"", "2\n", "1\n", "-3\n", "laptop\n", "99999999999999999999\n"}) {
        writeFirmware(text);
        EXPECT_EQ(chassis(), std::nullopt) << text;
    }
}

} // namespace
