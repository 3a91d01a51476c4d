/// A host and an extension in one process, connected for real.
#pragma once

#include "linux/dbus/ExtensionConnection.h"
#include "linux/dbus/HostConnection.h"
#include "linux/dbus/Protocol.h"
#include "platform/views/Color.h"
#include "support/EventLoop.h"
#include "support/PrivateDirectory.h"

#include <gmock/gmock.h>

#include <memory>
#include <mutex>
#include <string>
#include <vector>

/// What a load came to: the text, the colour, or the error's words.
struct Loaded {
    runtime::Value value;
    base::ErrorRef error;

    std::string text() const
    {
        return error ? "error: " + error->description() : runtime::fromValue<std::string>(value);
    }
};

class Connected : public ::testing::Test {
protected:
    void listen(std::vector<dbus::HostItem> items)
    {
        dbus::HostConnection::Handlers handlers;
        handlers.editorConnected = [this] { ++m_connects; };
        handlers.finished = [this](std::vector<std::string> types) { m_finished.push_back(std::move(types)); };
        handlers.disconnected = [this] { ++m_hostDisconnects; };
        auto host = dbus::HostConnection::listen(m_directory.path() / "socket", std::move(items), std::move(handlers));
        ASSERT_TRUE(host) << host.error()->description();
        m_host = std::move(host).value();
    }

    std::unique_ptr<dbus::ExtensionConnection> newExtension(const std::string& address)
    {
        auto extension = std::make_unique<dbus::ExtensionConnection>(m_mainQueue);
        extension->setHostInterface({"VKVideoEditorExtensionHostProtocol", {kFinish}});
        const auto connected = extension->connect(address);
        EXPECT_TRUE(connected) << connected.error()->description();
        return extension;
    }

    /// Listens, connects, and fetches the list.
    void connect(std::vector<dbus::HostItem> items)
    {
        listen(std::move(items));
        m_extension = newExtension(m_host->address());
        fetch();
    }

    void fetch()
    {
        auto items = tests::whilePumping([this] { return m_extension->inputItems(); });
        ASSERT_TRUE(items) << items.error()->description();
        m_items = std::move(items).value();
    }

    /// Loads the first attachment of some items at once; the results are in the order in which they came.
    std::vector<Loaded> load(const std::vector<std::size_t>& which, const char* type = platform::kGenericDataType)
    {
        std::mutex mutex;
        std::vector<Loaded> loaded;
        for (const std::size_t index : which)
            m_items.at(index).attachments.at(0)->loadItemForTypeIdentifier(
                type, [&](const runtime::Value& value, const base::ErrorRef& error) {
                    const std::lock_guard lock(mutex);
                    loaded.push_back({value, error});
                    m_mainQueue.post([] {});
                });
        EXPECT_TRUE(tests::pumpUntil(m_mainQueue, [&] {
            const std::lock_guard lock(mutex);
            return loaded.size() == which.size();
        }));
        const std::lock_guard lock(mutex);
        return loaded;
    }

    Loaded load(std::size_t index, const char* type = platform::kGenericDataType)
    {
        return load(std::vector{index}, type).at(0);
    }

    static dbus::HostItem text(std::string title, std::string value)
    {
        return {std::move(title), {dbus::HostAttachment::of(std::move(value), platform::kTextType)}};
    }

    inline static const runtime::Selector kFinish{"extensionDidFinishWithActivityTypes:"};

    tests::PrivateDirectory m_directory;
    base::SystemClock m_clock;
    base::MainQueue m_mainQueue{m_clock};
    std::unique_ptr<dbus::HostConnection> m_host;
    std::unique_ptr<dbus::ExtensionConnection> m_extension;
    std::vector<platform::InputItem> m_items;
    int m_connects = 0;
    int m_hostDisconnects = 0;
    std::vector<std::vector<std::string>> m_finished;
};
