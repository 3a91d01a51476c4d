#include "linux/dbus/RecorderAnswers.h"

#include "base/Text.h"
#include "linux/dbus/EditRequest.h"
#include "linux/dbus/SessionResult.h"
#include "linux/dbus/Wire.h"

#include <QVariantMap>

#include <cstddef>
#include <cstdio>
#include <string_view>

namespace dbus {

namespace {

const char* const kBadInput = "org.clipsa.Error.BadInput";
const char* const kFailed = "org.clipsa.Error.Failed";
constexpr std::size_t kLongestLine = 500; // of the log, in bytes

void refuse(const QDBusConnection& bus, const QDBusMessage& call, const char* error, const std::string& why,
            const std::string& untold)
{
    const std::string line = untold.empty() ? why : why + " (" + untold + ")";
    std::fprintf(stderr, "clipsa: %s\n", base::printable(std::string_view(line).substr(0, kLongestLine)).c_str());
    if (call.isReplyRequired())
        bus.send(call.createErrorReply(QLatin1String(error), toQt(why)));
}

void tell(const QDBusConnection& bus, const SessionAddress& session, const char* signal, const QVariantList& values)
{
    auto message = QDBusMessage::createTargetedSignal(session.caller, session.path, QLatin1String(kSessionInterface),
                                                      QLatin1String(signal));
    message.setArguments(values);
    bus.send(message);
}

void tellResult(const QDBusConnection& bus, const SessionAddress& session, const SessionResult& result)
{
    QVariantMap members;
    for (const auto& [name, text] : result)
        members.insert(toQt(name), toQt(text));
    if (!members.isEmpty())
        tell(bus, session, "Result", {members});
}

} // namespace

void answer(const QDBusConnection& bus, const QDBusMessage& call, const QVariantList& values)
{
    if (call.isReplyRequired())
        bus.send(call.createReply(values));
}

void refuse(const QDBusConnection& bus, const QDBusMessage& call, const base::ErrorRef& error)
{
    const auto untold = error->userInfo().find(kUntoldKey);
    refuse(bus, call, error->domain() == kBadInputDomain ? kBadInput : kFailed, error->description(),
           untold == error->userInfo().end() ? "" : untold->second);
}

void refuse(const QDBusConnection& bus, const QDBusMessage& call, const std::string& why)
{
    refuse(bus, call, kBadInput, why, {});
}

void tellNote(const QDBusConnection& bus, const SessionAddress& session, const MovieNote& note)
{
    if (note.kind == MovieNote::Kind::Saved)
        tell(bus, session, "Saved", {toQt(note.path)});
    else if (note.kind == MovieNote::Kind::Unsaved)
        tell(bus, session, "SaveFailed", {toQt(note.path), toQt(note.why)});
    tellResult(bus, session, resultOf(note));
}

void tellCompleted(const QDBusConnection& bus, const SessionAddress& session, const std::vector<std::string>& types)
{
    tell(bus, session, "Completed", {toQt(types)});
}

void tellEnded(const QDBusConnection& bus, const SessionAddress& session, const std::string& failure)
{
    if (!failure.empty()) {
        tell(bus, session, "Failed", {toQt(failure)});
        tellResult(bus, session, resultOfFailure(failure));
    }
    tell(bus, session, "Ended", {});
}

} // namespace dbus
