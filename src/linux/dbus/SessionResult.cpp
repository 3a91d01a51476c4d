#include "linux/dbus/SessionResult.h"

namespace dbus {

namespace {

SessionResult known(SessionResult members)
{
    std::erase_if(members, [](const auto& member) { return member.second.empty(); });
    return members;
}

} // namespace

SessionResult resultOf(const MovieNote& note)
{
    switch (note.kind) {
    case MovieNote::Kind::Saved:
        return known({{"outcome", "saved"}, {"path", note.path}});
    case MovieNote::Kind::Unsaved:
        return known({{"outcome", "not-saved"}, {"path", note.path}, {"reason", note.why}});
    case MovieNote::Kind::Shared:
        return known({{"outcome", "shared"}, {"type", note.type}, {"receiver", note.receiver}});
    case MovieNote::Kind::Unshared:
        return known(
            {{"outcome", "not-shared"}, {"type", note.type}, {"receiver", note.receiver}, {"reason", note.why}});
    case MovieNote::Kind::Refused:
        break;
    }
    return {};
}

SessionResult resultOfFailure(const std::string& reason)
{
    return known({{"outcome", "failed"}, {"reason", reason}});
}

} // namespace dbus
