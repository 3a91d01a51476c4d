// A host that speaks D-Bus but not our protocol.
#include "Connected.h"

#include <QDBusArgument>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusMetaType>
#include <QDBusServer>
#include <QDBusVariant>
#include <QDBusVirtualObject>

#include <limits>
#include <optional>

using testing::HasSubstr;

namespace {

struct Quadruple {
    double red = 0, green = 0, blue = 0, alpha = 0;
};

QDBusArgument& operator<<(QDBusArgument& out, const Quadruple& value)
{
    out.beginStructure();
    out << value.red << value.green << value.blue << value.alpha;
    out.endStructure();
    return out;
}

const QDBusArgument& operator>>(const QDBusArgument& in, Quadruple&)
{
    return in;
}

/// An item with one attachment of no types in particular.
struct Entry {};

QDBusArgument& operator<<(QDBusArgument& out, const Entry&)
{
    out.beginStructure();
    out << QStringLiteral("title") << QList<QStringList>{QStringList{}};
    out.endStructure();
    return out;
}

const QDBusArgument& operator>>(const QDBusArgument& in, Entry&)
{
    return in;
}

} // namespace

Q_DECLARE_METATYPE(Quadruple)
Q_DECLARE_METATYPE(Entry)

namespace {

class HostileHost : public Connected {
protected:
    struct Host final : QDBusVirtualObject {
        explicit Host(const QString& address) : server(address)
        {
            connect(&server, &QDBusServer::newConnection, this, [this](QDBusConnection peer) {
                connection = peer;
                peer.registerVirtualObject(QStringLiteral("/org/clipsa/Host"), this);
            });
        }
        QString introspect(const QString&) const override { return {}; }
        bool handleMessage(const QDBusMessage& message, const QDBusConnection& peer) override
        {
            if (message.member() == QLatin1String("InputItems"))
                return peer.send(list ? message.createReply(*list) : goodList(message));
            return peer.send(message.createReply(item));
        }
        /// One item with one generic attachment, written by hand.
        static QDBusMessage goodList(const QDBusMessage& message)
        {
            QDBusArgument argument;
            argument.beginArray(QMetaType::fromType<Entry>());
            argument << Entry{};
            argument.endArray();
            return message.createReply(QVariant::fromValue(argument));
        }

        QDBusServer server;
        std::optional<QDBusConnection> connection;
        std::optional<QVariantList> list;
        QVariantList item;
    };

    HostileHost()
    {
        qDBusRegisterMetaType<Quadruple>();
        qDBusRegisterMetaType<QList<QStringList>>();
        qDBusRegisterMetaType<Entry>();
        m_hostile.emplace(QString::fromStdString("unix:path=" + (m_directory.path() / "hostile").native()));
        m_extension = newExtension(m_hostile->server.address().toStdString());
    }

    Loaded loadOf(const QVariantList& reply, const char* type = platform::kGenericDataType)
    {
        if (m_items.empty())
            fetch();
        m_hostile->item = reply;
        return load(0, type);
    }

    static QVariant boxed(const QVariant& value) { return QVariant::fromValue(QDBusVariant(value)); }

    std::optional<Host> m_hostile;
};

TEST_F(HostileHost, SendsWhatIsGoodToo)
{
    EXPECT_EQ(loadOf({boxed(QStringLiteral("fine"))}).text(), "fine");
    EXPECT_EQ(runtime::fromValue<platform::Color>(loadOf({boxed(QVariant::fromValue(Quadruple{0, 0.5, 1, 1}))}).value),
              (platform::Color{0, 0.5, 1, 1}));
}

TEST_F(HostileHost, WrongTypesAreErrorsOfTheItem)
{
    const QVariant wrong[] = {boxed(42),
                              boxed(true),
                              boxed(QByteArray("bytes")),
                              boxed(QStringList{QStringLiteral("a")}),
                              boxed(boxed(QStringLiteral("twice"))),
                              boxed(QVariantMap{}),
                              boxed(1.5)};
    for (const QVariant& value : wrong)
        EXPECT_TRUE(loadOf({value}).error) << value.value<QDBusVariant>().variant().typeName();
    EXPECT_EQ(loadOf({boxed(QStringLiteral("fine"))}).text(), "fine");
}

TEST_F(HostileHost, RepliesOfAnotherFormAreErrorsOfTheItem)
{
    EXPECT_TRUE(loadOf({}).error);
    EXPECT_TRUE(loadOf({QStringLiteral("not in a variant")}).error);
    EXPECT_TRUE(loadOf({boxed(QStringLiteral("one")), boxed(QStringLiteral("too many"))}).error);
}

TEST_F(HostileHost, ColorsThatAreNoneAreErrors)
{
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const double infinity = std::numeric_limits<double>::infinity();
    for (const Quadruple& color :
         {Quadruple{nan, 0, 0, 1}, Quadruple{0, -0.1, 0, 1}, Quadruple{0, 0, 1.1, 1}, Quadruple{0, 0, 0, infinity}})
        EXPECT_TRUE(loadOf({boxed(QVariant::fromValue(color))}).error);
}

TEST_F(HostileHost, TextAboveOneMiBIsAnError)
{
    EXPECT_THAT(loadOf({boxed(QString(static_cast<int>(dbus::kMaximumTextSize) + 1, u'x'))}).text(),
                HasSubstr("longer than 1 MiB"));
    EXPECT_EQ(loadOf({boxed(QString(static_cast<int>(dbus::kMaximumTextSize), u'x'))}).text().size(),
              dbus::kMaximumTextSize);
    // 1 MiB is counted in bytes.
    EXPECT_TRUE(loadOf({boxed(QString(static_cast<int>(dbus::kMaximumTextSize) / 2 + 1, u'ä'))}).error);
}

TEST_F(HostileHost, AListOfAnotherFormIsAnError)
{
    for (const QVariantList& list :
         {QVariantList{}, QVariantList{QStringLiteral("x")}, QVariantList{QStringList{}}, QVariantList{1, 2}}) {
        m_hostile->list = list;
        EXPECT_FALSE(tests::whilePumping([this] { return m_extension->inputItems(); }));
    }
    // A failed fetch is not remembered.
    m_hostile->list.reset();
    EXPECT_TRUE(tests::whilePumping([this] { return m_extension->inputItems(); }));
}

} // namespace
