// A host that answers when it likes whether it has a message.
#include "Connected.h"

#include <gio/gio.h>

#include <atomic>
#include <condition_variable>
#include <future>
#include <thread>

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

template <typename Object> struct Unref {
    void operator()(Object* object) const { g_object_unref(object); }
};

template <typename Object> using Ref = std::unique_ptr<Object, Unref<Object>>;

/// libdbus answers pings itself, whatever its user does; GIO lets us keep them back. On a thread of its own.
class SlowHost {
public:
    explicit SlowHost(const std::string& address) : m_context(g_main_context_new())
    {
        std::promise<bool> started;
        auto listening = started.get_future();
        m_thread = std::thread([&] { run(address, started); });
        EXPECT_TRUE(listening.get()) << "nobody listens at " << address;
    }
    ~SlowHost()
    {
        g_main_loop_quit(m_loop);
        m_thread.join();
        m_pings.clear();
        m_connection.reset();
        g_main_loop_unref(m_loop);
        g_main_context_unref(m_context);
    }
    SlowHost(const SlowHost&) = delete;
    SlowHost& operator=(const SlowHost&) = delete;

    /// False where they do not come.
    bool waitForPings(std::size_t count) const
    {
        std::unique_lock lock(m_mutex);
        return m_came.wait_for(lock, std::chrono::seconds(20), [&] { return m_pings.size() == count; });
    }

    /// To all that were kept back.
    void answer() const
    {
        for (const auto& ping : m_pings)
            send(Ref<GDBusMessage>(g_dbus_message_new_method_reply(ping.get())));
    }
    void refuse(const char* why) const
    {
        for (const auto& ping : m_pings)
            send(Ref<GDBusMessage>(
                g_dbus_message_new_method_error_literal(ping.get(), "org.freedesktop.DBus.Error.Failed", why)));
    }

private:
    void run(const std::string& address, std::promise<bool>& started)
    {
        g_main_context_push_thread_default(m_context);
        const std::unique_ptr<char, decltype(&g_free)> guid(g_dbus_generate_guid(), g_free);
        const Ref<GDBusServer> server(
            g_dbus_server_new_sync(address.c_str(), G_DBUS_SERVER_FLAGS_NONE, guid.get(), nullptr, nullptr, nullptr));
        if (server) {
            g_signal_connect(server.get(), "new-connection", G_CALLBACK(accept), this);
            g_dbus_server_start(server.get());
        }
        started.set_value(server != nullptr);
        g_main_loop_run(m_loop);
        g_main_context_pop_thread_default(m_context);
    }
    static gboolean accept(GDBusServer*, GDBusConnection* connection, SlowHost* self)
    {
        const std::lock_guard lock(self->m_mutex);
        self->m_connection.reset(G_DBUS_CONNECTION(g_object_ref(connection)));
        g_dbus_connection_add_filter(connection, keepPings, self, nullptr);
        return TRUE;
    }
    static GDBusMessage* keepPings(GDBusConnection*, GDBusMessage* message, gboolean incoming, gpointer self)
    {
        if (!incoming || g_strcmp0(g_dbus_message_get_member(message), "Ping") != 0)
            return message;
        auto& host = *static_cast<SlowHost*>(self);
        const std::lock_guard lock(host.m_mutex);
        host.m_pings.emplace_back(message);
        host.m_came.notify_all();
        return nullptr;
    }
    void send(const Ref<GDBusMessage>& message) const
    {
        g_dbus_connection_send_message(m_connection.get(), message.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr,
                                       nullptr);
    }

    GMainContext* m_context;
    GMainLoop* m_loop = g_main_loop_new(m_context, FALSE);
    std::thread m_thread;
    mutable std::condition_variable m_came;
    mutable std::mutex m_mutex; // guards what follows
    Ref<GDBusConnection> m_connection;
    std::vector<Ref<GDBusMessage>> m_pings;
};

class ASlowHost : public Connected {
protected:
    ASlowHost() { m_extension = newExtension(m_address); }
    ~ASlowHost() override { m_extension.reset(); } // which still calls the host

    /// Two messages, as the host sees them.
    void sendTwo()
    {
        m_extension->setSentHandler([this] { ++m_sent; });
        const auto proxy = m_extension->remoteObjectProxyWithErrorHandler(
            [this](const base::ErrorRef& error) { m_errors.push_back(error->description()); });
        for (int i = 0; i < 2; ++i)
            proxy->send(kFinish, {runtime::toValue(std::vector<std::string>{"x"})});
        ASSERT_TRUE(m_slow.waitForPings(2));
    }

    std::string m_address = "unix:path=" + (m_directory.path() / "slow").native();
    SlowHost m_slow{m_address};
    int m_sent = 0;
    std::vector<std::string> m_errors;
};

TEST_F(ASlowHost, IsToldWhatItRefusesAndSoIsTheSenderOnce)
{
    sendTwo();
    EXPECT_FALSE(m_extension->flush(std::chrono::milliseconds(0))) << "nobody knows yet whether it has them";
    std::thread refusing([this] { m_slow.refuse("no room"); });
    EXPECT_TRUE(m_extension->flush(std::chrono::hours(1))) << "woken when it has";
    refusing.join();
    EXPECT_THAT(m_errors, IsEmpty()) << "told on the main queue";
    EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] { return m_errors.size() >= 2; }));
    EXPECT_THAT(m_errors, ElementsAre(testing::HasSubstr("no room"), testing::HasSubstr("no room")));
    EXPECT_EQ(m_sent, 2);
}

TEST_F(ASlowHost, TellsNobodyWhoHasLeft)
{
    sendTwo();
    m_slow.refuse("no room");
    m_extension.reset();
    m_mainQueue.drain();
    EXPECT_THAT(m_errors, IsEmpty());
}

TEST_F(ASlowHost, IsWaitedForByAConnectionThatGoes)
{
    sendTwo();
    std::atomic<bool> gone = false;
    std::thread leaving([&] {
        m_extension.reset();
        gone = true;
    });
    // It has every chance to go too early.
    for (int i = 0; i < 50'000 && !gone; ++i)
        std::this_thread::yield();
    EXPECT_FALSE(gone) << "the host may not have its messages yet";
    m_slow.answer();
    leaving.join();
}

} // namespace
