// Without a display: software rendering is byte for byte the same from run to run.
#include <QByteArray>

#include <gmock/gmock.h>

int main(int argc, char** argv)
{
    qputenv("QT_QPA_PLATFORM", "offscreen");
    qputenv("QT_QUICK_BACKEND", "software");
    ::testing::InitGoogleMock(&argc, argv);
    return RUN_ALL_TESTS();
}
