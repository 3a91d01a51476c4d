#include "app/editor/Drawing.h"

#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <string>

namespace {

class Drawing : public testing::Test {
protected:
    void addDevice(const std::string& name) { devices.write(name, ""); }

    tests::PrivateDirectory devices;
};

TEST_F(Drawing, AMachineWithoutDevicesHasNoGraphicsDevice)
{
    EXPECT_FALSE(app::hasGraphicsDevice(devices.path()));
    EXPECT_FALSE(app::hasGraphicsDevice(devices.path() / "missing"));
}

TEST_F(Drawing, AScreenAloneDoesNotDraw)
{
    addDevice("dri/card0");
    EXPECT_FALSE(app::hasGraphicsDevice(devices.path()));
}

TEST_F(Drawing, ARenderNodeDraws)
{
    addDevice("dri/renderD128");
    EXPECT_TRUE(app::hasGraphicsDevice(devices.path()));
}

TEST_F(Drawing, ATelephonesOwnDriverDraws)
{
    addDevice("kgsl-3d0");
    EXPECT_TRUE(app::hasGraphicsDevice(devices.path()));
}

} // namespace
