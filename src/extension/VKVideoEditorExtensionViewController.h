/// The extension's principal controller: it loads what the host handed over, shows the editor as its child, and tells
/// the host when the user is done. Main queue only, but for the completion of loading.
#pragma once

#include "extension/Payload.h"
#include "extension/VKVideoEditorExtensionProtocols.h"
#include "platform/hosting/ExtensionContext.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

/// A plain view that can hold the extension's focus. Nobody here makes one: an interface description may name it.
class VKVideoEditorExtensionViewControllerFocusView final : public platform::View {
public:
    using View::View;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }
    bool canBecomeFirstResponder() const override { return true; }
};

class VKVideoEditorExtensionViewController final : public platform::ExtensionViewController,
                                                   public VKVideoEditorViewControllerDelegate,
                                                   public VKVideoEditorExtensionProtocol {
public:
    /// Called with the values that are there by then; the three required ones always are.
    using InputItemsCompletion = std::function<void(
        const std::optional<std::string>& bundleIdentifier, const std::optional<std::string>& appName,
        const std::optional<base::Url>& movieURL, const std::optional<base::Url>& fileAttachmentURL,
        const std::optional<std::string>& overrideShareMessage,
        const std::optional<platform::Color>& overrideTintColor)>;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    void viewDidLoad() override;
    void viewWillAppear(bool animated) override;
    void viewDidDisappear(bool animated) override;

    /// Starts loading; builds the editor once what is required has come, and again with each optional value after that.
    void setupChildViewControllers();
    void tearDownChildViewControllers();
    /// Builds an editor from what is known by now. A former editor stays where it is.
    void setupVideoEditorController();
    /// Returns at once. `completion` runs on the threads that load, whenever a load ends with the three required values
    /// there: one call after the other, each with newer values than the one before.
    void inputItemsFromClientWithCompletionHandler(InputItemsCompletion completion);

    void videoEditor_didFinishWithActivityTypes(VKVideoEditorViewController& editor,
                                                const std::shared_ptr<ActivityTypes>& activityTypes) override;

    // Properties. The payload's values arrive from the threads that load them.
    const std::shared_ptr<VKVideoEditorViewController>& videoEditorViewController() const
    {
        return here(m_videoEditorViewController);
    }
    void setVideoEditorViewController(std::shared_ptr<VKVideoEditorViewController> editor)
    {
        here(m_videoEditorViewController) = std::move(editor);
    }
    std::optional<std::string> bundleIdentifier() const { return m_payload->values().bundleIdentifier; }
    void setBundleIdentifier(std::optional<std::string> value)
    {
        m_payload->set(&PayloadValues::bundleIdentifier, std::move(value));
    }
    std::optional<std::string> appName() const { return m_payload->values().appName; }
    void setAppName(std::optional<std::string> value) { m_payload->set(&PayloadValues::appName, std::move(value)); }
    std::optional<base::Url> movieURL() const { return m_payload->values().movieURL; }
    void setMovieURL(std::optional<base::Url> value) { m_payload->set(&PayloadValues::movieURL, std::move(value)); }
    std::optional<base::Url> fileAttachmentURL() const { return m_payload->values().fileAttachmentURL; }
    void setFileAttachmentURL(std::optional<base::Url> value)
    {
        m_payload->set(&PayloadValues::fileAttachmentURL, std::move(value));
    }
    std::optional<std::string> overrideShareMessage() const { return m_payload->values().overrideShareMessage; }
    void setOverrideShareMessage(std::optional<std::string> value)
    {
        m_payload->set(&PayloadValues::overrideShareMessage, std::move(value));
    }
    std::optional<platform::Color> overrideTintColor() const { return m_payload->values().overrideTintColor; }
    void setOverrideTintColor(std::optional<platform::Color> value)
    {
        m_payload->set(&PayloadValues::overrideTintColor, std::move(value));
    }

private:
    std::shared_ptr<VKVideoEditorViewController> m_videoEditorViewController;
    std::shared_ptr<Payload> m_payload = std::make_shared<Payload>();
};
