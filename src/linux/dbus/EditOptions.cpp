#include "linux/dbus/EditOptions.h"

#include "linux/dbus/Protocol.h"
#include "linux/dbus/Wire.h"

#include <QDBusUnixFileDescriptor>

#include <algorithm>
#include <fcntl.h>
#include <string_view>

namespace dbus {

namespace {

base::ErrorRef badOption(std::string_view key, const std::string& what)
{
    return base::Error::make(kBadInputDomain, kBadArgument, "the option \"" + std::string(key) + "\" must be " + what);
}

void setVariable(EditRequest& request, const char* name, const QVariant& value)
{
    // What NUL would end, and what is no text, never reaches the environment.
    const std::string text = fromQt(value.toString());
    if (!text.empty() && text.size() < 4096 && text.find('\0') == std::string::npos)
        request.environment.emplace_back(name, text);
}

base::Result<void> takeText(const std::string& key, const std::string& text, EditRequest& request)
{
    if (key == "name") {
        request.movieName = text;
    } else if (key == "app-name") {
        request.appName = text;
    } else if (key == "bundle-id") {
        request.bundleIdentifier = text;
    } else if (key == "attachment") {
        if (!text.starts_with('/'))
            return badOption(key, "a path that starts with a slash, or a file descriptor");
        request.attachmentPath = text;
    } else if (key == "attachment-name") {
        request.attachmentName = text;
    } else if (key == "message") {
        request.message = text;
    } else if (key == "tint") {
        request.tint = platform::Color::fromHex(text);
        if (!request.tint)
            return badOption(key, "a colour like #3584e4, not \"" + text.substr(0, 40) + "\"");
    }
    return {};
}

} // namespace

posix::FileDescriptor descriptorFrom(const QVariant& value)
{
    const auto descriptor = value.value<QDBusUnixFileDescriptor>();
    return descriptor.isValid() ? posix::FileDescriptor(::fcntl(descriptor.fileDescriptor(), F_DUPFD_CLOEXEC, 3))
                                : posix::FileDescriptor();
}

base::Result<void> takeOptions(const QVariantMap& options, EditRequest& request)
{
    static constexpr std::string_view kTexts[] = {"name",    "app-name", "bundle-id", "attachment", "attachment-name",
                                                  "message", "tint"};
    for (auto option = options.begin(); option != options.end(); ++option) {
        const std::string key = fromQt(option.key());
        const QVariant& value = option.value();
        if (key == "attachment" && value.metaType() == QMetaType::fromType<QDBusUnixFileDescriptor>()) {
            request.attachment = descriptorFrom(value);
            continue;
        }
        if (std::find(std::begin(kTexts), std::end(kTexts), key) == std::end(kTexts))
            continue;
        if (value.metaType() != QMetaType::fromType<QString>())
            return badOption(key, "a text");
        if (auto taken = takeText(key, fromQt(value.toString()), request); !taken)
            return taken;
    }
    takePlatformData(options, request);
    return {};
}

void takePlatformData(const QVariantMap& data, EditRequest& request)
{
    setVariable(request, "XDG_ACTIVATION_TOKEN", data.value(QStringLiteral("activation-token")));
    setVariable(request, "DESKTOP_STARTUP_ID", data.value(QStringLiteral("desktop-startup-id")));
}

} // namespace dbus
