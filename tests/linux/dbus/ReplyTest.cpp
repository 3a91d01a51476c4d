#include "linux/dbus/Reply.h"

#include "support/EventLoop.h"

#include <QDBusError>
#include <QDBusPendingCall>

#include <gtest/gtest.h>

namespace {

TEST(AnAnswer, IsToldOnceAndLeavesNothingBehind)
{
    QObject context;
    int told = 0;
    dbus::whenAnswered(QDBusPendingCall::fromError(QDBusError(QDBusError::Failed, QStringLiteral("no"))), context,
                       [&](const QDBusMessage& reply) {
                           EXPECT_EQ(reply.errorMessage(), QStringLiteral("no"));
                           ++told;
                       });
    EXPECT_EQ(told, 0) << "not before the call returns";
    EXPECT_TRUE(tests::pumpUntil([&] { return told > 0; }));
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    EXPECT_TRUE(context.children().isEmpty());
    QCoreApplication::processEvents();
    EXPECT_EQ(told, 1);
}

} // namespace
