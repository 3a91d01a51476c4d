/// The extension over fakes of every role, with a payload whose items come when a test says so. Main thread only.
#pragma once

#include "extension/VKVideoEditorExtensionContext.h"
#include "extension/VKVideoEditorExtensionViewController.h"
#include "support/FakePlatform.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

/// An attachment whose loading ends when the test says so, on a thread of its own.
class ScriptedProvider final : public platform::ItemProvider {
public:
    explicit ScriptedProvider(bool conforms = true) : m_conforms(conforms) {}

    bool hasItemConformingToTypeIdentifier(std::string_view type) const override
    {
        return m_conforms && type == platform::kGenericDataType;
    }
    void loadItemForTypeIdentifier(std::string_view /*type*/, LoadCompletion completion) override
    {
        m_completion = std::move(completion);
    }

    bool isLoading() const { return m_completion != nullptr; }
    /// On the caller's thread.
    void answer(const runtime::Value& item, const base::ErrorRef& error = nullptr) { m_completion(item, error); }
    void deliver(const runtime::Value& item, const base::ErrorRef& error = nullptr)
    {
        std::thread([&] { answer(item, error); }).join();
    }

private:
    bool m_conforms;
    LoadCompletion m_completion;
};

/// Answers before the load call returns.
class ImmediateProvider final : public platform::ItemProvider {
public:
    explicit ImmediateProvider(runtime::Value item) : m_item(std::move(item)) {}

    int loads = 0;

    bool hasItemConformingToTypeIdentifier(std::string_view /*type*/) const override { return true; }
    void loadItemForTypeIdentifier(std::string_view /*type*/, LoadCompletion completion) override
    {
        ++loads;
        completion(m_item, nullptr);
    }

private:
    runtime::Value m_item;
};

class RecordingConnection final : public platform::AuxiliaryConnection {
public:
    struct Message {
        std::string selector;
        std::vector<std::string> list;
    };
    std::vector<Message> messages;
    base::ErrorRef failure;

    std::shared_ptr<platform::RemoteProxy> remoteObjectProxyWithErrorHandler(ErrorHandler handler) override
    {
        return std::make_shared<Proxy>(*this, std::move(handler));
    }

private:
    class Proxy final : public platform::RemoteProxy {
    public:
        Proxy(RecordingConnection& connection, ErrorHandler handler)
            : m_connection(connection), m_handler(std::move(handler))
        {
        }
        void send(const runtime::Selector& message, const runtime::Arguments& arguments) override
        {
            if (m_connection.failure) {
                m_handler(m_connection.failure);
                return;
            }
            m_connection.messages.push_back(
                {message.name(), runtime::fromValue<std::vector<std::string>>(arguments.at(0))});
        }

    private:
        RecordingConnection& m_connection;
        ErrorHandler m_handler;
    };
};

class ExtensionTest : public testing::Test {
protected:
    static constexpr const char* kMovie = "/movie.mp4";

    tests::FakePlatform fake;
    std::shared_ptr<RecordingConnection> connection = std::make_shared<RecordingConnection>();
    std::map<std::string, std::shared_ptr<ScriptedProvider>> providers;
    std::vector<platform::InputItem> items;
    std::shared_ptr<VKVideoEditorExtensionViewController> controller;
    std::shared_ptr<VKVideoEditorExtensionContext> context;

    ~ExtensionTest() override { fake.window->setRootViewController(nullptr); }

    /// One more item that the test delivers by its title.
    void offer(const std::string& title)
    {
        providers[title] = std::make_shared<ScriptedProvider>();
        items.push_back({title, {providers[title]}});
    }
    void offerRequired()
    {
        offer(VKVideoEditorExtensionMoviePathKey);
        offer(VKVideoEditorExtensionAppNameKey);
        offer(VKVideoEditorExtensionBundleIdentifierKey);
    }
    void deliverRequired()
    {
        deliver(VKVideoEditorExtensionMoviePathKey, std::string(kMovie));
        deliver(VKVideoEditorExtensionAppNameKey, std::string("Game"));
        deliver(VKVideoEditorExtensionBundleIdentifierKey, std::string("org.example.Game"));
    }
    void deliver(const std::string& title, const runtime::Value& item, const base::ErrorRef& error = nullptr)
    {
        providers.at(title)->deliver(item, error);
    }
    /// Starts as the runtime does, by the names of the declaration.
    void start() { start(fake.platform); }
    void start(const platform::Platform& platform)
    {
        VKVideoEditorExtensionContext::classObject();
        VKVideoEditorExtensionViewController::classObject();
        auto extension =
            platform::instantiateExtension({"VKVideoEditorExtensionContext", "VKVideoEditorExtensionViewController"});
        extension.context->setUp(platform, items, connection);
        context = std::dynamic_pointer_cast<VKVideoEditorExtensionContext>(extension.context);
        controller = std::dynamic_pointer_cast<VKVideoEditorExtensionViewController>(extension.principal);
        controller->view()->setFrame({{0, 0}, tests::FakePlatform::kPhone});
    }
    void show()
    {
        fake.window->setRootViewController(controller);
        fake.window->setVisible(true);
    }
    auto editor() const { return controller->videoEditorViewController(); }
    bool logged(std::string_view text) const
    {
        return fake.machine.log.contains(base::MemoryLog::Line::Kind::Message, text);
    }
};
