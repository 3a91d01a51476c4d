/// The strip with thumbnails, a play head and two trim handles. Main queue only.
///
/// It asks its data source for the duration and pictures, and tells its delegate what the user does. Both are weak.
/// Where it is editable, a grip stands at each end of the strip; taking one is how editing begins. A grip that is held
/// still spreads the moments around it over the whole strip until it is let go.
///
/// Split by concern: values, pictures and places here, what fingers and keys do in MovieScrubberTouches.cpp.
#pragma once

#include "platform/files/MessageCatalog.h"
#include "platform/views/Control.h"
#include "platform/views/Image.h"
#include "platform/views/ScrubberParts.h"

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <vector>

namespace platform {

class MovieScrubber;

class MovieScrubberDelegate {
public:
    virtual ~MovieScrubberDelegate() = default;
    virtual void movieScrubber_valueDidChange(MovieScrubber& scrubber, double seconds) = 0;
    virtual void movieScrubberDidBeginScrubbing_withHandle(MovieScrubber& scrubber, int handle) = 0;
    virtual void movieScrubberDidEndScrubbing_withHandle(MovieScrubber& scrubber, int handle) = 0;
    virtual void movieScrubber_editingStartValueDidChange(MovieScrubber& scrubber, double seconds) = 0;
    virtual void movieScrubber_editingEndValueDidChange(MovieScrubber& scrubber, double seconds) = 0;
    virtual void movieScrubberDidBeginEditing(MovieScrubber& scrubber) = 0;
    virtual void movieScrubberDidCancelEditing(MovieScrubber& scrubber) = 0;
};

class MovieScrubberDataSource {
public:
    virtual ~MovieScrubberDataSource() = default;
    /// Seconds; not a number while nothing is loaded.
    virtual double movieScrubberDuration(MovieScrubber& scrubber) = 0;
    virtual std::vector<double> movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(MovieScrubber& scrubber,
                                                                                         std::int32_t count,
                                                                                         double start, double end) = 0;
    /// Width by height.
    virtual double movieScrubberThumbnailAspectRatio(MovieScrubber& scrubber) = 0;
    /// Answered later through `setThumbnailImage_forTimestamp`. A source without pictures leaves the strip plain.
    virtual void movieScrubber_requestThumbnailImageForTimestamp(MovieScrubber& /*scrubber*/, double /*timestamp*/) {}
};

class MovieScrubber final : public Control {
public:
    /// The strip's own height in points.
    static constexpr double kHeight = 38;
    /// Free above and below the pictures, so that the play head stands out of them; in points.
    static constexpr double kTrackInset = 4;
    /// How far from the play head, in points, a finger still takes it: half of what a thumb covers.
    static constexpr double kGrabDistance = 22;
    /// How far beyond a grip, in points, a finger still takes it, so that it is as wide as a thumb.
    static constexpr double kGripReach = 14;
    /// How far, in points, a finger that holds still may roll.
    static constexpr double kStillness = 3;
    /// What is spread over the strip around a grip that is held still: seconds at most, of a short movie this part.
    static constexpr double kZoomedSeconds = 4;
    static constexpr double kZoomedPart = 0.25;
    /// How long the frame takes to where it belongs.
    static constexpr base::Instant kFrameDuration = std::chrono::milliseconds(250);

    /// `words` outlive it.
    explicit MovieScrubber(const MessageCatalog& words);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const MessageCatalog& words() const { return here(m_words); }

    void setDelegate(std::weak_ptr<MovieScrubberDelegate> delegate) { here(m_delegate) = std::move(delegate); }
    std::shared_ptr<MovieScrubberDelegate> delegate() const { return here(m_delegate).lock(); }
    void setDataSource(std::weak_ptr<MovieScrubberDataSource> dataSource)
    {
        here(m_dataSource) = std::move(dataSource);
    }
    std::shared_ptr<MovieScrubberDataSource> dataSource() const { return here(m_dataSource).lock(); }

    double minimumTrimLength() const { return here(m_minimumTrimLength); } ///< seconds
    void setMinimumTrimLength(double seconds) { here(m_minimumTrimLength) = seconds; }
    bool isEditable() const { return here(m_editable); }
    void setEditable(bool editable);
    /// Seconds that a grip is held still until the strip is zoomed; never when 0.
    double zoomDelay() const { return here(m_zoomDelay); }
    void setZoomDelay(double seconds) { here(m_zoomDelay) = seconds; }
    double edgeInset() const { return here(m_edgeInset); } ///< points
    void setEdgeInset(double points);

    /// Where the play head is, in seconds. Setting it tells nobody. NaN is kept as 0.
    double value() const { return here(m_value); }
    void setValue(double seconds);
    /// Seconds; 0 while nothing is loaded.
    double duration() const { return here(m_duration); }

    // The range, in seconds: all of the movie unless it is being edited.
    bool isEditing() const { return here(m_editing); }
    /// Tells nobody. Leaving lets go of a grip that is held.
    void setEditing_animated(bool editing, bool animated);
    double editingStartValue() const { return here(m_range).start; }
    double editingEndValue() const { return here(m_range).end; }
    /// The minimum trim length, or all of a movie that is shorter.
    double leastRange() const { return std::min(here(m_minimumTrimLength), m_duration); }

    /// Asks the data source for everything anew.
    void reloadData();
    void setThumbnailImage_forTimestamp(ImageRef image, double timestamp);

    // For the presenter: what is where, in own coordinates.
    /// With the grips at its ends.
    base::Rect stripRect() const;
    /// Where the pictures are, and the time that can be shown.
    base::Rect trackRect() const;
    double playHeadX() const;
    /// Those on the strip, evenly spaced.
    const std::vector<double>& timestamps() const { return here(m_timestamps); }
    /// Those on the strip and, while it is zoomed, those of the whole movie.
    const std::map<double, ImageRef>& thumbnails() const { return here(m_thumbnails); }
    bool isZoomed() const { return here(m_zoomed); }
    // Seconds at the left and at the right end of the track.
    double visibleStart() const { return here(m_visible).start; }
    double visibleEnd() const { return here(m_visible).end; }
    ScrubberHandle held() const { return here(m_held); }
    // Null until first laid out.
    const std::shared_ptr<PlayHeadView>& playHead() const { return here(m_playHead); }
    const std::shared_ptr<TrimFrameView>& trimFrame() const { return here(m_frameView); }
    const std::shared_ptr<TrimHandleView>& startHandle() const { return here(m_startHandle); }
    const std::shared_ptr<TrimHandleView>& endHandle() const { return here(m_endHandle); }

    base::Size sizeThatFits() const override { return {frame().width(), kHeight}; }
    Accessibility accessibility() const override;
    void setNumber(double seconds) override { scrubTo(seconds); }
    void touchBegan(const Touch& touch) override;
    void touchMoved(const Touch& touch) override;
    void touchEnded(const Touch& touch) override;
    void touchCancelled(const Touch& touch) override;

    // For keys and assistive technology.
    /// Moves the play head as a finger would: begins, changes, ends.
    void scrubTo(double seconds);
    /// Moves a handle as a finger would: begins editing where it has not begun.
    void moveHandle(ScrubberHandle handle, double seconds);

    /// Places its parts, and asks for the pictures that a new width makes room for.
    void layoutSubviews() override;

private:
    /// Seconds.
    struct Span {
        double start = 0;
        double end = 0;
        friend bool operator==(const Span&, const Span&) = default;
    };

    double xOf(double seconds) const;
    double secondsAt(double x) const;

    ScrubberHandle handleAt(double x) const;
    void beginDrag();
    void dragTo(double seconds);
    void endDrag();
    void holdHandle(ScrubberHandle handle, double x);
    void letGo();
    bool beginEditingWith(ScrubberHandle handle);
    void setEdge(ScrubberHandle handle, double seconds);
    void tellEdge(ScrubberHandle handle);
    void waitForStillness(double x);
    void zoomAround(ScrubberHandle handle);
    void endZoom();

    void makeParts();
    void placeParts();
    void placePlayHead();
    void placePartsAnimated();
    std::int32_t thumbnailCount() const;
    /// Asks for the timestamps, then for the pictures: all of them, or those that are not here yet.
    void requestThumbnails(bool all);

    const MessageCatalog& m_words;
    std::weak_ptr<MovieScrubberDelegate> m_delegate;
    std::weak_ptr<MovieScrubberDataSource> m_dataSource;
    double m_minimumTrimLength = 0;
    double m_zoomDelay = 0;
    double m_edgeInset = 0;
    double m_value = 0;
    double m_duration = 0;
    double m_aspectRatio = 1;
    bool m_editable = false;
    bool m_editing = false;
    Span m_range;
    Span m_visible; ///< what the strip shows
    bool m_zoomed = false;

    ScrubberHandle m_held = ScrubberHandle::None;
    std::optional<int> m_draggingTouch;
    double m_grabOffset = 0; ///< points from the finger to what it holds
    double m_stillX = 0;     ///< where the finger last came to rest
    unsigned m_stillness = 0;

    std::int32_t m_thumbnailCount = 0; ///< as last asked for
    std::vector<double> m_timestamps;
    std::vector<double> m_overview; ///< timestamps of the whole movie
    std::map<double, ImageRef> m_thumbnails;

    std::shared_ptr<View> m_shadeBefore;
    std::shared_ptr<View> m_shadeAfter;
    std::shared_ptr<TrimFrameView> m_frameView;
    std::shared_ptr<PlayHeadView> m_playHead;
    std::shared_ptr<TrimHandleView> m_startHandle;
    std::shared_ptr<TrimHandleView> m_endHandle;
};

} // namespace platform
