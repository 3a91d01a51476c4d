#include "extension/VKVideoEditorExtensionViewController.h"

#include "extension/PayloadCollector.h"
#include "extension/VKVideoEditorExtensionContext.h"

#include <utility>

const runtime::Class& VKVideoEditorExtensionViewControllerFocusView::classObject()
{
    using Self = VKVideoEditorExtensionViewControllerFocusView;
    static const runtime::Class& instance =
        runtime::ClassBuilder<Self>("VKVideoEditorExtensionViewControllerFocusView", &View::classObject())
            .maker([] { return std::make_shared<Self>(); })
            .build();
    return instance;
}

const runtime::Class& VKVideoEditorExtensionViewController::classObject()
{
    using Self = VKVideoEditorExtensionViewController;
    static const runtime::Class& instance =
        runtime::ClassBuilder<Self>("VKVideoEditorExtensionViewController", &ExtensionViewController::classObject())
            .maker([] { return std::make_shared<Self>(); })
            .build();
    return instance;
}

void VKVideoEditorExtensionViewController::viewDidLoad()
{
    assertHere();
    ExtensionViewController::viewDidLoad();
    setupChildViewControllers();
}

void VKVideoEditorExtensionViewController::viewWillAppear(bool animated)
{
    assertHere();
    ExtensionViewController::viewWillAppear(animated);
    if (!videoEditorViewController())
        setupVideoEditorController();
}

void VKVideoEditorExtensionViewController::viewDidDisappear(bool animated)
{
    assertHere();
    ExtensionViewController::viewDidDisappear(animated);
    extensionContext()->platform().system.log.message("VKVideoEditorExtensionViewController -viewDidDisappear:");
    tearDownChildViewControllers();
}

void VKVideoEditorExtensionViewController::setupChildViewControllers()
{
    assertHere();
    const base::System& system = extensionContext()->platform().system;
    system.log.message("VKVideoEditorExtensionViewController -setupChildViewControllers");

    // The loader's thread writes the values, but never holds the controller: the last reference must die here.
    inputItemsFromClientWithCompletionHandler(
        [weak = weakSelf<VKVideoEditorExtensionViewController>(), payload = m_payload,
         &system](const auto& bundleIdentifier, const auto& appName, const auto& movieURL,
                  const auto& fileAttachmentURL, const auto& overrideShareMessage, const auto& overrideTintColor) {
            payload->setValues(
                {bundleIdentifier, appName, movieURL, fileAttachmentURL, overrideShareMessage, overrideTintColor});
            system.mainQueue.post([weak, &system] {
                const auto self = weak.lock();
                if (!self)
                    return;
                system.log.message("loaded input items");
                self->setupVideoEditorController();
            });
        });
}

void VKVideoEditorExtensionViewController::inputItemsFromClientWithCompletionHandler(InputItemsCompletion completion)
{
    base::Log& log = extensionContext()->platform().system.log;
    log.message("VKVideoEditorExtensionViewController -inputItemsFromClientWithCompletionHandler:");

    // Shared by all loads of this call, which outlive it.
    const auto collector =
        std::make_shared<PayloadCollector>([completion = std::move(completion)](const PayloadValues& values) {
            completion(values.bundleIdentifier, values.appName, values.movieURL, values.fileAttachmentURL,
                       values.overrideShareMessage, values.overrideTintColor);
        });
    for (const platform::InputItem& item : extensionContext()->inputItems()) {
        // A load that completes the required values ends the enumeration, if that is still going on.
        if (collector->hasAllRequired())
            break;
        if (item.attachments.empty()
            || !item.attachments.front()->hasItemConformingToTypeIdentifier(platform::kGenericDataType))
            continue;
        item.attachments.front()->loadItemForTypeIdentifier(
            platform::kGenericDataType,
            [collector, &log, title = item.attributedTitle](const runtime::Value& value, const base::ErrorRef& error) {
                if (error) {
                    log.error("Error loading input item for type");
                    log.console(title + ": " + error->description());
                    return;
                }
                collector->collect(title, value);
            });
    }
}

void VKVideoEditorExtensionViewController::setupVideoEditorController()
{
    assertHere();
    const auto editor =
        VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
            extensionContext()->platform(), bundleIdentifier(), movieURL(), appName(), overrideTintColor(),
            view()->bounds());
    // The former one stays, covered: its buttons are not to be found by a key or by assistive technology.
    if (const auto former = videoEditorViewController())
        former->view()->setHidden(true);
    setVideoEditorViewController(editor);
    editor->setFileAttachmentURL(fileAttachmentURL());
    editor->setOverrideShareMessage(overrideShareMessage());
    editor->setDelegate(self<VKVideoEditorExtensionViewController>());
    addChildViewController(editor);
    view()->addSubview(editor->view());
    editor->didMoveToParentViewController(this);
}

void VKVideoEditorExtensionViewController::tearDownChildViewControllers()
{
    assertHere();
    if (const auto editor = videoEditorViewController()) {
        editor->willMoveToParentViewController(nullptr);
        editor->view()->removeFromSuperview();
        editor->removeFromParentViewController();
    }
    setVideoEditorViewController(nullptr);
}

void VKVideoEditorExtensionViewController::videoEditor_didFinishWithActivityTypes(
    VKVideoEditorViewController& /*editor*/, const std::shared_ptr<ActivityTypes>& activityTypes)
{
    assertHere();
    extensionContext()->platform().system.log.message(
        "VKVideoEditorExtensionViewController -videoEditorViewDidFinishWithActivityTypes:");
    const auto context = std::dynamic_pointer_cast<VKVideoEditorExtensionContext>(extensionContext());
    if (const auto host = context ? context->extensionObjectProxy() : nullptr)
        host->extensionDidFinishWithActivityTypes(activityTypes);
}
