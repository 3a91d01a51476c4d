/// The one screen of the system: it shows the recording with its chrome, plays it, and tells its delegate which
/// activities the user completed. Main queue only.
///
/// Split by concern: construction and lifecycle here and in the .cpp of this name, the two arrangements in +Layout,
/// playing in +Playback, the scrubber and trim mode in +Trimming, its pictures in +Thumbnails, sharing in +Sharing, finishing in +Finish.
#pragma once

#include "editor/VKVideoEditorProperties.h"
#include "platform/hosting/Platform.h"
#include "platform/views/ViewController.h"

class VKStoreInfo;
class VKVideoEditorViewController;

class VKVideoEditorViewControllerDelegate {
public:
    virtual ~VKVideoEditorViewControllerDelegate() = default;
    /// The user is done. `activityTypes` is the editor's own list, not a copy.
    virtual void videoEditor_didFinishWithActivityTypes(VKVideoEditorViewController& editor,
                                                        const std::shared_ptr<ActivityTypes>& activityTypes) = 0;
};

class VKVideoEditorViewController final : public platform::ViewController,
                                          public VKVideoEditorProperties,
                                          public platform::ToolbarDelegate,
                                          public platform::MovieScrubberDelegate,
                                          public platform::MovieScrubberDataSource,
                                          public runtime::KeyValueObserver {
public:
    /// How long the chrome takes to fade.
    static constexpr base::Instant kFadeDuration = std::chrono::milliseconds(250);

    /// `size` becomes the view's frame unless it is empty. Nothing is checked: whatever is missing stays missing.
    static std::shared_ptr<VKVideoEditorViewController>
    initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
        const platform::Platform& platform, std::optional<std::string> bundleIdentifier, std::optional<base::Url> url,
        std::optional<std::string> applicationName, std::optional<platform::Color> overrideTintColor, base::Rect size);
    /// The same without a tint colour, the view's frame left as it is made.
    static std::shared_ptr<VKVideoEditorViewController> initWithBundleIdentifier_URL_applicationName(
        const platform::Platform& platform, std::optional<std::string> bundleIdentifier, std::optional<base::Url> url,
        std::optional<std::string> applicationName);
    ~VKVideoEditorViewController() override;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    std::shared_ptr<VKVideoEditorViewControllerDelegate> delegate() const { return here(m_delegate).lock(); }
    void setDelegate(std::weak_ptr<VKVideoEditorViewControllerDelegate> delegate)
    {
        here(m_delegate) = std::move(delegate);
    }

    /// Asked of the device once a process.
    bool deviceHasHomeButton() const;
    /// 1 when the view is wider than high (landscape), else 0; a square counts as 0.
    int currentOrientation();

    // Lifecycle and events.
    void viewWillAppear(bool animated) override;
    void viewWillDisappear(bool animated) override;
    void viewDidLayoutSubviews() override;
    void viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                            platform::TransitionCoordinator& coordinator) override;
    bool canBecomeFirstResponder() const override { return true; }
    void motionEnded_withEvent(platform::MotionSubtype motion, const platform::MotionEvent& event) override;
    std::vector<platform::KeyCommand> keyCommands() const override;

    // Chrome.
    void handleSingleTap(const std::shared_ptr<runtime::Object>& recognizer);
    void configureClipsaUIHidden();
    void showUI();
    void hideUI();

    // The two arrangements.
    void applyPhoneUILayout();
    void applyPadUILayout();
    void applyPhoneConstraints();
    void applyPadConstraints();

    // Playing.
    void reloadAVLayerWithURL(const std::optional<base::Url>& url);
    void observeValueForKeyPath_ofObject_change_context(std::string_view keyPath, runtime::Object& object,
                                                        const runtime::KeyValueChange& change, void* context) override;
    void itemDidFinishPlaying(const std::shared_ptr<runtime::Object>& notification);
    void playAction();
    void pauseAction();
    /// Re-fits the picture and the bars to the view, and has the scrubber ask for everything anew.
    void refreshAVRotation();
    /// Seconds; not a number until the item is ready.
    double getPlayerDuration() const;

    // The scrubber's questions and answers, and trim mode.
    void movieScrubber_valueDidChange(platform::MovieScrubber& scrubber, double seconds) override;
    void movieScrubberDidBeginScrubbing_withHandle(platform::MovieScrubber& scrubber, int handle) override;
    void movieScrubberDidEndScrubbing_withHandle(platform::MovieScrubber& scrubber, int handle) override;
    void movieScrubber_editingStartValueDidChange(platform::MovieScrubber& scrubber, double seconds) override;
    void movieScrubber_editingEndValueDidChange(platform::MovieScrubber& scrubber, double seconds) override;
    void movieScrubberDidBeginEditing(platform::MovieScrubber& scrubber) override;
    void movieScrubberDidCancelEditing(platform::MovieScrubber& scrubber) override;
    double movieScrubberDuration(platform::MovieScrubber& scrubber) override;
    std::vector<double> movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(platform::MovieScrubber& scrubber,
                                                                                 std::int32_t count, double start,
                                                                                 double end) override;
    void editMode();
    void previewMode();
    /// Leaves trim mode, unless a trim is being exported.
    void undoAction();
    /// Exports the chosen range into a new file, which then becomes the movie. The former trim, which may be the movie
    /// being read, is removed first.
    void trimVideo();
    /// A new place in the temporary store, named after the app and the second.
    base::Url trimFileURL() const;

    // The strip's pictures.
    double movieScrubberThumbnailAspectRatio(platform::MovieScrubber& scrubber) override;
    void movieScrubber_requestThumbnailImageForTimestamp(platform::MovieScrubber& scrubber, double timestamp) override;
    /// Hands the picture to the scrubber, on the main queue's next turn.
    void setThumbnailFromCacheWithTimeStamp(double timestamp);
    /// What a picture is fitted into, in pixels; the width carries the screen's scale twice.
    base::Size getThumbnailSize() const;
    /// The upright size of the item's first video track; zero without one.
    base::Size getVideoSize() const;

    // Finishing.
    void doneAction();
    /// Saves and finishes; in trim mode it applies the trim instead.
    void saveAction();

    // Sharing.
    /// Opens the share sheet, on the main queue's next turn, and resets the top bar.
    void shareAction();
    /// Asks the store about the app first; the sheet comes with its answer.
    void displayShareSheetWithVideoURL(const std::optional<base::Url>& url);

    // Keys: what has no button of its own.
    void togglePlayback();
    void leave();
    void seekBackward();
    void seekForward();
    void stepBackward();
    void stepForward();
    void goToStart();
    void goToEnd();
    /// Put a handle where the play head is; the way into trim mode too.
    void trimStartHere();
    void trimEndHere();
    void confirmTrim();

private:
    using ViewController::here; // the properties' is theirs

    explicit VKVideoEditorViewController(const platform::Platform& platform) : m_platform(platform) {}

    // Construction, in this order.
    void makeVideoOverlay();
    void makeTitle();
    void makePlayerChain();
    void makeScrubber();
    void makeBarItems();
    void makeToolbars(const std::optional<platform::Color>& overrideTintColor);
    void makeViewTree();
    void applyLayoutForDevice();

    /// On the main screen, whatever the view's place in it. The screen is our window, which may change its size.
    void centreVideoOverlayPlayButton();
    base::Rect topToolBarFrame();
    base::Rect bottomToolBarFrame();
    void buildPlayer();
    void observePlayerItem();
    void stopObservingPlayerItem();
    void addPlayHeadObserver();
    static void saveMixed(const std::shared_ptr<VKVideoEditorViewController>& self,
                          const std::optional<base::Url>& output, const base::ErrorRef& error);
    void savedToLibrary(const base::ErrorRef& error);
    void share();
    void presentShareSheet(const std::optional<base::Url>& url, const VKStoreInfo& info);
    platform::ShareItems shareItems(const std::optional<base::Url>& url, const VKStoreInfo& info) const;
    std::string shareText(const VKStoreInfo& info) const;
    std::shared_ptr<platform::Activity> videoServiceActivity() const;
    /// Any thread.
    static void handThumbnailOver(base::MainQueue& mainQueue, const std::weak_ptr<VKVideoEditorViewController>& editor,
                                  double timestamp);
    void dropThumbnails();
    void exportEnded(const platform::ExportSession& session);
    void showTrimmedMovie(const std::optional<base::Url>& url);
    void layOutBars(const std::shared_ptr<platform::BarButtonItem>& playOrPause);
    void fadeChromeTo(double alpha);
    base::MediaTime mediaTime(double seconds) const;
    void addStripConstraint(platform::LayoutAttribute attribute, const std::shared_ptr<platform::View>& other,
                            platform::LayoutAttribute otherAttribute);

    const platform::Platform& m_platform;
    std::weak_ptr<VKVideoEditorViewControllerDelegate> m_delegate;
};
