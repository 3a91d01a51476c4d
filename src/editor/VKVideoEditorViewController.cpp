#include "editor/VKVideoEditorViewController.h"

#include "base/Once.h"
#include "platform/views/GestureRecognizer.h"
#include "support/VKDateExtensions.h"
#include "support/VKFileManagerExtensions.h"

using platform::BackdropView;
using platform::BarButtonItem;
using platform::Color;
using platform::Label;
using platform::MotionSubtype;
using platform::MovieScrubber;
using platform::Toolbar;
using platform::View;
using runtime::Selector;

namespace {

constexpr double kTitleWidth = 120;     // points, of both lines of the title
constexpr double kTitleLineHeight = 17; // points
constexpr double kTitleFontSize = 15;
constexpr double kDateFontSize = 10;
constexpr double kMinimumTrimLength = 1.0; // seconds
constexpr double kZoomDelay = 0.5;         // seconds
constexpr double kScrubberEdgeInset = 10;  // points
constexpr double kFixedSpaceShare = 0.005; // of the view's width
constexpr std::int32_t kNoHomeButton = 2;  // the capability service's answer on devices without one

std::shared_ptr<Label> titleLine(double y, double fontSize, const std::string& text)
{
    auto label = std::make_shared<Label>(base::Rect::make(0, y, kTitleWidth, kTitleLineHeight));
    label->setFontSize(fontSize);
    label->setTextAlignment(platform::TextAlignment::Center);
    label->setText(text);
    return label;
}

} // namespace

std::shared_ptr<VKVideoEditorViewController>
VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
    const platform::Platform& platform, std::optional<std::string> bundleIdentifier, std::optional<base::Url> url,
    std::optional<std::string> applicationName, std::optional<Color> overrideTintColor, base::Rect size)
{
    std::shared_ptr<VKVideoEditorViewController> editor(new VKVideoEditorViewController(platform));
    if (!size.isEmpty())
        editor->view()->setFrame(size);
    editor->setActivityTypes(std::make_shared<ActivityTypes>());
    editor->setHasHomeButton(editor->deviceHasHomeButton());
    editor->makeVideoOverlay();
    editor->setOriginalVideoURL(url);
    editor->setVideoURL(std::move(url));
    editor->setApplicationName(std::move(applicationName));
    editor->setBundleIdentifier(std::move(bundleIdentifier));
    editor->makeTitle();
    editor->setTrimFilePath(editor->trimFileURL());
    editor->makePlayerChain();
    editor->makeScrubber();
    editor->addPlayHeadObserver();
    editor->makeBarItems();
    editor->makeToolbars(overrideTintColor);
    editor->makeViewTree();
    editor->applyLayoutForDevice();
    return editor;
}

std::shared_ptr<VKVideoEditorViewController> VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName(
    const platform::Platform& platform, std::optional<std::string> bundleIdentifier, std::optional<base::Url> url,
    std::optional<std::string> applicationName)
{
    return initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
        platform, std::move(bundleIdentifier), std::move(url), std::move(applicationName), std::nullopt,
        base::Rect::null());
}

VKVideoEditorViewController::~VKVideoEditorViewController()
{
    // The boundary token in timeObserver() is left to end with its player.
    avPlayer()->removeTimeObserver(playbackTimeObserver());
    stopObservingPlayerItem();
    m_platform.notifications.removeObserver(*this);
    VKExtensions::_srDeleteAllTempFiles(m_platform.files);
}

const runtime::Class& VKVideoEditorViewController::classObject()
{
    using Self = VKVideoEditorViewController;
    static const runtime::Class& instance =
        runtime::ClassBuilder<Self>("VKVideoEditorViewController", &ViewController::classObject())
            .method("handleSingleTap:", &Self::handleSingleTap)
            .method("playAction", &Self::playAction)
            .method("pauseAction", &Self::pauseAction)
            .method("itemDidFinishPlaying:", &Self::itemDidFinishPlaying)
            .method("undoAction", &Self::undoAction)
            .method("doneAction", &Self::doneAction)
            .method("saveAction", &Self::saveAction)
            .method("shareAction", &Self::shareAction)
            .method("togglePlayback", &Self::togglePlayback)
            .method("leave", &Self::leave)
            .method("seekBackward", &Self::seekBackward)
            .method("seekForward", &Self::seekForward)
            .method("stepBackward", &Self::stepBackward)
            .method("stepForward", &Self::stepForward)
            .method("goToStart", &Self::goToStart)
            .method("goToEnd", &Self::goToEnd)
            .method("trimStartHere", &Self::trimStartHere)
            .method("trimEndHere", &Self::trimEndHere)
            .method("confirmTrim", &Self::confirmTrim)
            .build();
    return instance;
}

bool VKVideoEditorViewController::deviceHasHomeButton() const
{
    assertHere();
    static base::Once<bool> answer;
    return answer.get(
        [this] { return m_platform.device.integerAnswer(platform::kDeviceHomeButtonKey, 0) != kNoHomeButton; });
}

int VKVideoEditorViewController::currentOrientation()
{
    assertHere();
    const base::Rect bounds = view()->bounds();
    return bounds.width() > bounds.height() ? 1 : 0;
}

// Construction

void VKVideoEditorViewController::makeVideoOverlay()
{
    const auto overlay = std::make_shared<View>(view()->bounds());
    overlay->setAutoresizingMask(platform::kFlexibleWidth | platform::kFlexibleHeight);
    overlay->setAccessibilityLabel(m_platform.words.text("EDITOR_RECORDING"));
    setVideoOverlay(overlay);
    overlay->addGestureRecognizer(
        std::make_shared<platform::TapGestureRecognizer>(weakSelf<runtime::Object>(), Selector("handleSingleTap:")));

    const auto play = VKExtensions::_srVideoOverlayButtonWithStyle(m_platform, VKVideoOverlayButton::kStyleAutomatic);
    play->setTarget_action(weakSelf<runtime::Object>(), Selector("playAction"));
    setVideoOverlayPlayButton(play);
    centreVideoOverlayPlayButton();
}

void VKVideoEditorViewController::makeTitle()
{
    setTitleLabel(titleLine(0, kTitleFontSize, applicationName().value_or("")));

    std::string date;
    if (videoURL())
        if (const auto created = VKExtensions::_srGetCreationDateForFile(m_platform.files, *videoURL()))
            date = VKExtensions::_srGetStringFromDate(m_platform.calendar, *created);
    // Hangs below the label's own height.
    titleLabel()->addSubview(titleLine(kTitleLineHeight, kDateFontSize, date));
    setTitleButton(BarButtonItem::withCustomView(titleLabel()));
}

void VKVideoEditorViewController::makePlayerChain()
{
    buildPlayer();
    avPlayer()->seekToTime(base::MediaTime::zero());
    m_platform.notifications.addObserver(self<runtime::Object>(), Selector("itemDidFinishPlaying:"),
                                         platform::kPlayerItemDidPlayToEndNotification, avPlayerItem());
    setAvPlayerLayer(platform::PlayerLayer::withPlayer(avPlayer()));
    observePlayerItem();
}

void VKVideoEditorViewController::makeScrubber()
{
    setScrubberContainterView(std::make_shared<BackdropView>(BackdropView::kStyleChrome));
    scrubberContainterView()->setTranslatesAutoresizingMaskIntoConstraints(false);

    const auto trimmer = std::make_shared<MovieScrubber>(m_platform.words);
    trimmer->setAutoresizingMask(platform::kFlexibleWidth);
    trimmer->setMinimumTrimLength(kMinimumTrimLength);
    trimmer->setEditable(true);
    trimmer->setZoomDelay(kZoomDelay);
    trimmer->setEdgeInset(kScrubberEdgeInset);
    setAvTrimmer(trimmer);
}

void VKVideoEditorViewController::makeBarItems()
{
    using Kind = BarButtonItem::Kind;
    const auto item = [this](Kind kind, const char* action) {
        return std::make_shared<BarButtonItem>(m_platform.words, kind, weakSelf<runtime::Object>(), Selector(action));
    };
    setShareButton(item(Kind::Action, "shareAction"));
    setUndoButton(item(Kind::Undo, "undoAction"));
    setPauseButton(item(Kind::Pause, "pauseAction"));
    setPlayButton(item(Kind::Play, "playAction"));
    // Both ways out of the editor finish it; in trim mode, cancel undoes and done saves.
    setDoneButton(item(Kind::Done, "doneAction"));
    setSaveButton(item(Kind::Save, "saveAction"));
    setCancelButton(item(Kind::Cancel, "doneAction"));
    setCancelTrimButton(item(Kind::Cancel, "undoAction"));
    setTrimButton(item(Kind::Done, "saveAction"));
    setFlexSpace(BarButtonItem::flexibleSpace());
    setFixSpace(BarButtonItem::fixedSpace(view()->frame().width() * kFixedSpaceShare));
}

void VKVideoEditorViewController::makeToolbars(const std::optional<Color>& overrideTintColor)
{
    const auto toolbar = [this](base::Rect frame, const char* nameKey) {
        auto bar = std::make_shared<Toolbar>(frame);
        bar->setAutoresizingMask(platform::kFlexibleWidth);
        bar->setDelegate(self<VKVideoEditorViewController>());
        bar->setAccessibilityLabel(m_platform.words.text(nameKey));
        return bar;
    };
    setTopToolBar(toolbar(topToolBarFrame(), "EDITOR_TOP_BAR"));
    setBottomToolBar(toolbar(bottomToolBarFrame(), "EDITOR_BOTTOM_BAR"));
    if (overrideTintColor)
        topToolBar()->setTintColor(overrideTintColor);
}

void VKVideoEditorViewController::makeViewTree()
{
    const auto background = std::make_shared<View>(view()->frame());
    background->setBackgroundColor(Color::black());
    background->setAutoresizingMask(platform::kFlexibleWidth | platform::kFlexibleHeight);
    view()->addSubview(background);
    view()->addSublayer(avPlayerLayer());
    view()->addSubview(videoOverlay());
    // The bottom bar comes and goes with the arrangements.
    view()->addSubview(topToolBar());
    view()->addSubview(scrubberContainterView());
    scrubberContainterView()->addSubview(avTrimmer());
    view()->addSubview(videoOverlayPlayButton()->asView());
}

// Lifecycle and events

void VKVideoEditorViewController::viewWillAppear(bool animated)
{
    assertHere();
    becomeFirstResponder();
    ViewController::viewWillAppear(animated);
}

void VKVideoEditorViewController::viewWillDisappear(bool animated)
{
    assertHere();
    resignFirstResponder();
    ViewController::viewWillDisappear(animated);
}

void VKVideoEditorViewController::viewDidLayoutSubviews()
{
    assertHere();
    ViewController::viewDidLayoutSubviews();
    // Laid out before it is made when the view gets its first frame.
    if (avPlayerLayer())
        avPlayerLayer()->setFrame(view()->bounds());
}

void VKVideoEditorViewController::motionEnded_withEvent(MotionSubtype motion, const platform::MotionEvent& event)
{
    assertHere();
    if (event.subtype == MotionSubtype::Shake && isTrimming() && !isExporting())
        undoAction();
    ViewController::motionEnded_withEvent(motion, event);
}

std::vector<platform::KeyCommand> VKVideoEditorViewController::keyCommands() const
{
    assertHere();
    using platform::Key;
    return {
        {Key::Space, 0, false, Selector("togglePlayback")},
        {Key::Left, 0, false, Selector("seekBackward")},
        {Key::Right, 0, false, Selector("seekForward")},
        {Key::Comma, 0, false, Selector("stepBackward")},
        {Key::Period, 0, false, Selector("stepForward")},
        {Key::Home, 0, false, Selector("goToStart")},
        {Key::End, 0, false, Selector("goToEnd")},
        {Key::Character, 'i', false, Selector("trimStartHere")},
        {Key::Character, 'o', false, Selector("trimEndHere")},
        {Key::Return, 0, false, Selector("confirmTrim")},
        {Key::Character, 's', true, Selector("shareAction"), true},
        {Key::Escape, 0, false, Selector("leave")},
    };
}

void VKVideoEditorViewController::leave()
{
    assertHere();
    if (isTrimming())
        undoAction();
    else
        doneAction();
}

// Chrome

void VKVideoEditorViewController::handleSingleTap(const std::shared_ptr<runtime::Object>& /*recognizer*/)
{
    assertHere();
    configureClipsaUIHidden();
}

void VKVideoEditorViewController::configureClipsaUIHidden()
{
    assertHere();
    if (isUIHidden())
        showUI();
    else
        hideUI();
}

void VKVideoEditorViewController::showUI()
{
    assertHere();
    setUiHidden(false);
    fadeChromeTo(1.0);
}

void VKVideoEditorViewController::hideUI()
{
    assertHere();
    setUiHidden(true);
    fadeChromeTo(0.0);
}

void VKVideoEditorViewController::fadeChromeTo(double alpha)
{
    platform::animate(m_platform.system.mainQueue, kFadeDuration, [this, alpha] {
        topToolBar()->setAlpha(alpha);
        bottomToolBar()->setAlpha(alpha);
        scrubberContainterView()->setAlpha(alpha);
    });
}
