#include "linux/dbus/AskWho.h"

#include "linux/dbus/EditOptions.h"
#include "linux/dbus/Reply.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusUnixFileDescriptor>

#include <algorithm>
#include <charconv>
#include <fcntl.h>
#include <fstream>
#include <string_view>
#include <unistd.h>
#include <utility>

namespace dbus {

namespace {

void askCredentials(const QDBusConnection& bus, const QString& name, QObject& context,
                    std::function<void(const QVariantMap& credentials)> known)
{
    auto question = QDBusMessage::createMethodCall(
        QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
        QStringLiteral("org.freedesktop.DBus"), QStringLiteral("GetConnectionCredentials"));
    whenAnswered(bus.asyncCall(question << name), context, [known = std::move(known)](const QDBusMessage& reply) {
        const bool isAnswer = reply.type() == QDBusMessage::ReplyMessage && reply.signature() == QLatin1String("a{sv}");
        known(isAnswer ? qdbus_cast<QVariantMap>(reply.arguments().at(0)) : QVariantMap());
    });
}

bool areOfTheSame(const QVariantMap& one, const QVariantMap& other)
{
    static constexpr const char* kKeys[] = {"ProcessID", "UnixUserID", "LinuxSecurityLabel"};
    return std::all_of(std::begin(kKeys), std::end(kKeys), [&](const char* key) {
        return one.value(QLatin1String(key)) == other.value(QLatin1String(key));
    });
}

/// The number of the process that a descriptor stands for, as we know it; that of none, less than 1, when it has ended or
/// is not among those that we can see.
pid_t numberOf(int process)
{
    static constexpr std::string_view kName = "Pid:\t";
    std::ifstream file("/proc/self/fdinfo/" + std::to_string(process));
    pid_t number = 0;
    for (std::string line; std::getline(file, line);)
        if (line.starts_with(kName))
            std::from_chars(line.data() + kName.size(), line.data() + line.size(), number);
    return number;
}

std::string labelFrom(const QVariant& value)
{
    const QByteArray bytes = value.toByteArray();
    return bytes.constData(); // up to the zero byte that ends it
}

} // namespace

Asker askerFrom(const QVariantMap& credentials)
{
    Asker asker;
    asker.securityLabel = labelFrom(credentials.value(QStringLiteral("LinuxSecurityLabel")));
    bool hasUser = false;
    const uint user = credentials.value(QStringLiteral("UnixUserID")).toUInt(&hasUser);
    if (!hasUser || user != ::geteuid())
        return asker;
    const posix::FileDescriptor process = descriptorFrom(credentials.value(QStringLiteral("ProcessFD")));
    const pid_t number = process ? numberOf(process.get()) : credentials.value(QStringLiteral("ProcessID")).toInt();
    const std::string path = "/proc/" + std::to_string(number);
    posix::FileDescriptor directory(::open(path.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    // It had the number all the time if it still has it.
    if (!process || numberOf(process.get()) == number)
        asker.process = std::move(directory);
    return asker;
}

void askWho(const QDBusConnection& bus, const QString& name, QObject& context,
            std::function<void(std::shared_ptr<const Asker> asker)> known)
{
    askCredentials(bus, name, context, [bus, name, &context, known = std::move(known)](const QVariantMap& first) {
        const auto asker = std::make_shared<const Asker>(askerFrom(first));
        // Not every bus holds the process, whose number can have gone to another before we looked. Who had ended by then
        // has left the bus, too.
        askCredentials(bus, name, context, [known, first, asker](const QVariantMap& then) {
            known(areOfTheSame(first, then) ? asker : std::make_shared<const Asker>());
        });
    });
}

} // namespace dbus
