/// Recorders on a private bus, and editors that exist only on paper.
#pragma once

#include "linux/dbus/RecorderService.h"
#include "support/EventLoop.h"
#include "support/PrivateDirectory.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusObjectPath>
#include <QDBusPendingCallWatcher>
#include <QDBusUnixFileDescriptor>
#include <QDBusVirtualObject>

#include <gmock/gmock.h>

#include <fcntl.h>
#include <memory>
#include <utility>
#include <vector>

inline const QString kService = QStringLiteral("org.clipsa.Clipsa");
inline const QString kPath = QStringLiteral("/org/clipsa/Clipsa");

struct PaperEditor {
    dbus::EditRequest request;
    dbus::RecorderService::EditorEvents events;
    bool askedToGo = false;
    bool gone = false;
};

class Editor final : public dbus::RecorderService::Editor {
public:
    explicit Editor(std::shared_ptr<PaperEditor> paper) : m_paper(std::move(paper)) {}
    ~Editor() override { m_paper->gone = true; }
    void close() override { m_paper->askedToGo = true; }

private:
    std::shared_ptr<PaperEditor> m_paper;
};

/// A program of its own on the bus, as far as the bus can tell; writes down the signals that it gets.
class Caller final : public QDBusVirtualObject {
public:
    Caller()
        : m_name(QStringLiteral("caller-%1").arg(++s_count)),
          bus(QDBusConnection::connectToBus(QDBusConnection::SessionBus, m_name))
    {
        // Signals to us alone need no match; what is broadcast would need this one.
        auto match = QDBusMessage::createMethodCall(QStringLiteral("org.freedesktop.DBus"),
                                                    QStringLiteral("/org/freedesktop/DBus"),
                                                    QStringLiteral("org.freedesktop.DBus"), QStringLiteral("AddMatch"));
        bus.call(match << QStringLiteral("interface='org.clipsa.RecorderSession1'"));
    }
    ~Caller() override { leave(); }
    void leave() { QDBusConnection::disconnectFromBus(m_name); }

    QDBusPendingCall start(const char* interface, const char* member, const QVariantList& arguments,
                           const QString& path = kPath)
    {
        auto message = QDBusMessage::createMethodCall(kService, path, QLatin1String(interface), QLatin1String(member));
        message.setArguments(arguments);
        return bus.asyncCall(message);
    }

    QDBusMessage call(const char* interface, const char* member, const QVariantList& arguments,
                      const QString& path = kPath)
    {
        QDBusPendingCallWatcher pending(start(interface, member, arguments, path)); // wakes the event loop
        EXPECT_TRUE(tests::pumpUntil([&] { return pending.isFinished(); }));
        return pending.reply();
    }

    QDBusPendingCall startEdit(const QDBusUnixFileDescriptor& movie)
    {
        return start("org.clipsa.Recorder1", "Edit", {QVariant::fromValue(movie), QVariantMap()});
    }

    QString introspect(const QString&) const override { return {}; }
    bool handleMessage(const QDBusMessage&, const QDBusConnection&) override { return false; }

private:
    inline static int s_count = 0;
    QString m_name;

public:
    QDBusConnection bus;
};

class Recorders : public ::testing::Test {
protected:
    void serve(std::chrono::milliseconds idle = std::chrono::hours(1))
    {
        auto service = dbus::RecorderService::start(
            [this](dbus::EditRequest request, dbus::RecorderService::EditorEvents events) {
                const auto editor =
                    std::make_shared<PaperEditor>(PaperEditor{std::move(request), std::move(events), false, false});
                m_editors.push_back(editor);
                const auto tell = [editor, started = m_refusal ? base::Result<void>(m_refusal) : base::Result<void>()] {
                    editor->events.started(started);
                };
                if (!m_isSlow)
                    QMetaObject::invokeMethod(&m_context, tell, Qt::QueuedConnection);
                return std::make_unique<Editor>(editor);
            },
            idle, [this] { ++m_idle; });
        ASSERT_TRUE(service) << service.error()->description();
        m_service = std::move(service).value();
    }

    /// An open file with some bytes in it.
    QDBusUnixFileDescriptor movie()
    {
        const auto path = m_directory.write("movie.mp4", "moving pictures");
        const posix::FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
        return QDBusUnixFileDescriptor(file.get());
    }

    QDBusMessage edit(Caller& caller, const QVariantMap& options = {})
    {
        return caller.call("org.clipsa.Recorder1", "Edit", {QVariant::fromValue(movie()), options});
    }

    static QString sessionOf(const QDBusMessage& reply)
    {
        return reply.arguments().value(0).value<QDBusObjectPath>().path();
    }

    tests::PrivateDirectory m_directory;
    std::vector<std::shared_ptr<PaperEditor>> m_editors;
    base::ErrorRef m_refusal;
    bool m_isSlow = false; ///< the test itself says when an editor has started
    int m_idle = 0;
    QObject m_context;
    std::unique_ptr<dbus::RecorderService> m_service;
};
