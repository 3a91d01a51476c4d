// What recorders are told of results, member by member.
#include "linux/dbus/SessionResult.h"

#include <gmock/gmock.h>

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

namespace {

using Kind = dbus::MovieNote::Kind;

TEST(SessionResults, HaveTheMembersThatAreKnown)
{
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Saved, .path = "/a.mp4"}),
                ElementsAre(Pair("outcome", "saved"), Pair("path", "/a.mp4")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Unsaved, .path = "/a.mp4", .why = "full"}),
                ElementsAre(Pair("outcome", "not-saved"), Pair("path", "/a.mp4"), Pair("reason", "full")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Unsaved, .why = "full"}),
                ElementsAre(Pair("outcome", "not-saved"), Pair("reason", "full")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Shared, .type = "Mail"}),
                ElementsAre(Pair("outcome", "shared"), Pair("type", "Mail")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Shared, .type = "Bluetooth", .receiver = "Phone"}),
                ElementsAre(Pair("outcome", "shared"), Pair("type", "Bluetooth"), Pair("receiver", "Phone")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Unshared, .why = "gone", .type = "Bluetooth", .receiver = "Phone"}),
                ElementsAre(Pair("outcome", "not-shared"), Pair("type", "Bluetooth"), Pair("receiver", "Phone"),
                            Pair("reason", "gone")));
    EXPECT_THAT(dbus::resultOfFailure("it crashed"),
                ElementsAre(Pair("outcome", "failed"), Pair("reason", "it crashed")));
    EXPECT_THAT(dbus::resultOf({.kind = Kind::Refused, .why = "no movie"}), IsEmpty()) << "its session fails";
}

} // namespace
