// Without a display: software rendering is byte for byte the same from run to run. With CLIPSA_ON_SCREEN set, on the
// display and with the renderer that the environment names.
#include "Stage.h"

#include <QByteArray>
#include <QtGlobal>

#include <gmock/gmock.h>

int main(int argc, char** argv)
{
    if (!qEnvironmentVariableIsSet("CLIPSA_ON_SCREEN")) {
        qputenv("QT_QPA_PLATFORM", "offscreen");
        qputenv("QT_QUICK_BACKEND", "software");
    }
    ::testing::InitGoogleMock(&argc, argv);
    const int result = RUN_ALL_TESTS();
    tests::endApplication();
    return result;
}
