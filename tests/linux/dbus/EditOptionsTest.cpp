// What of a recorder's options reaches an editor, and how far.
#include "linux/dbus/EditOptions.h"

#include <QDBusUnixFileDescriptor>

#include <gmock/gmock.h>

#include <unistd.h>

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

namespace {

QVariantMap with(const char* key, const QString& text)
{
    return {{QLatin1String(key), text}};
}

TEST(EditOptions, TakeWordsOfTheDesktopThatFitIntoAnEnvironment)
{
    const auto environment = [](const QVariantMap& data) {
        dbus::EditRequest request;
        dbus::takePlatformData(data, request);
        return request.environment;
    };
    EXPECT_THAT(environment({{QStringLiteral("activation-token"), QStringLiteral("a")},
                             {QStringLiteral("desktop-startup-id"), QStringLiteral("b")}}),
                ElementsAre(Pair("XDG_ACTIVATION_TOKEN", "a"), Pair("DESKTOP_STARTUP_ID", "b")));
    EXPECT_THAT(environment({}), IsEmpty());
    EXPECT_THAT(environment(with("activation-token", QString())), IsEmpty());
    EXPECT_THAT(environment(with("activation-token", QString(4095, u'x'))),
                ElementsAre(Pair("XDG_ACTIVATION_TOKEN", std::string(4095, 'x'))));
    EXPECT_THAT(environment(with("activation-token", QString(4096, u'x'))), IsEmpty());
    EXPECT_THAT(environment(with("activation-token", QStringLiteral("a") + QChar(0) + QStringLiteral("b"))), IsEmpty());
}

TEST(EditOptions, QuoteNoMoreOfAColourThanALineHasRoomFor)
{
    dbus::EditRequest request;
    const auto taken = dbus::takeOptions(with("tint", QString(30, u'1') + QString(30, u'2')), request);
    ASSERT_FALSE(taken);
    EXPECT_EQ(taken.error()->description(), "the option \"tint\" must be a colour like #3584e4, not \""
                                                + std::string(30, '1') + std::string(10, '2') + "\"");
    EXPECT_EQ(taken.error()->domain(), dbus::kBadInputDomain);
}

TEST(EditOptions, AreTakenOneByOneAndTheUnknownLeft)
{
    dbus::EditRequest request;
    ASSERT_TRUE(dbus::takeOptions({{QStringLiteral("app-name"), QStringLiteral("Racer")},
                                   {QStringLiteral("nonsense"), QVariantMap{}},
                                   {QStringLiteral("tint"), QStringLiteral("#0000ff")},
                                   {QStringLiteral("name"), QStringLiteral("race.webm")}},
                                  request));
    EXPECT_EQ(request.appName, "Racer");
    EXPECT_EQ(request.movieName, "race.webm");
    EXPECT_EQ(request.tint, (platform::Color{0, 0, 1, 1}));
    EXPECT_EQ(request.message, std::nullopt);
}

TEST(EditOptions, HaveNoFileWhereNoneWasSent)
{
    EXPECT_FALSE(dbus::descriptorFrom(QVariant()));
    EXPECT_FALSE(dbus::descriptorFrom(QVariant::fromValue(QDBusUnixFileDescriptor())));
}

TEST(EditOptions, LeaveTheNumbersOfTheStandardStreamsToThose)
{
    const QVariant file = QVariant::fromValue(QDBusUnixFileDescriptor(STDERR_FILENO));
    const auto number = [&] {
        ::close(STDIN_FILENO);
        return dbus::descriptorFrom(file).get();
    };
    EXPECT_EXIT(::_exit(number() > STDERR_FILENO ? 0 : 1), testing::ExitedWithCode(0), "");
}

} // namespace
