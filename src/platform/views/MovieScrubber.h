/// The strip with thumbnails, a play head and two trim handles. Main queue only.
///
/// It asks its data source for the duration and pictures, and tells its delegate what the user does. Both are weak.
#pragma once

#include "platform/views/Control.h"
#include "platform/views/Image.h"

#include <cstdint>
#include <map>
#include <optional>
#include <vector>

namespace platform {

class MovieScrubber;

/// What the user holds.
enum class ScrubberHandle : int { None = 0, PlayHead = 1, Start = 2, End = 3 };

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
    /// How far from the play head, in points, a finger still takes it: half of what a thumb covers.
    static constexpr double kGrabDistance = 22;

    MovieScrubber();

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    void setDelegate(std::weak_ptr<MovieScrubberDelegate> delegate) { m_delegate = std::move(delegate); }
    std::shared_ptr<MovieScrubberDelegate> delegate() const { return m_delegate.lock(); }
    void setDataSource(std::weak_ptr<MovieScrubberDataSource> dataSource) { m_dataSource = std::move(dataSource); }
    std::shared_ptr<MovieScrubberDataSource> dataSource() const { return m_dataSource.lock(); }

    double minimumTrimLength() const { return m_minimumTrimLength; } ///< seconds
    void setMinimumTrimLength(double seconds) { m_minimumTrimLength = seconds; }
    bool isEditable() const { return m_editable; }
    void setEditable(bool editable) { m_editable = editable; }
    double zoomDelay() const { return m_zoomDelay; } ///< seconds
    void setZoomDelay(double seconds) { m_zoomDelay = seconds; }
    double edgeInset() const { return m_edgeInset; } ///< points
    void setEdgeInset(double points);

    /// Where the play head is, in seconds. Setting it tells nobody. NaN is kept as 0.
    double value() const { return m_value; }
    void setValue(double seconds);
    /// Seconds; 0 while nothing is loaded.
    double duration() const { return m_duration; }

    bool isEditing() const { return m_editing; }
    void setEditing_animated(bool editing, bool animated);
    /// Asks the data source for everything anew.
    void reloadData();
    void setThumbnailImage_forTimestamp(ImageRef image, double timestamp);

    // For the presenter: where things are, in own coordinates.
    base::Rect trackRect() const;
    double playHeadX() const;
    const std::map<double, ImageRef>& thumbnails() const { return m_thumbnails; }
    const std::vector<double>& timestamps() const { return m_timestamps; }

    base::Size sizeThatFits() const override { return {frame().width(), kHeight}; }
    Accessibility accessibility() const override;
    void touchBegan(const Touch& touch) override;
    void touchMoved(const Touch& touch) override;
    void touchEnded(const Touch& touch) override;
    void touchCancelled(const Touch& touch) override;

    /// Moves the play head as a finger would: begins, changes, ends. For keys and assistive technology.
    void scrubTo(double seconds);

    /// Asks for the pictures that a new width makes room for.
    void layoutSubviews() override;

private:
    double secondsAt(double x) const;
    void beginDrag();
    void dragTo(double seconds);
    void endDrag();
    std::int32_t thumbnailCount() const;
    /// Asks for the timestamps, then for the pictures: all of them, or those that are not here yet.
    void requestThumbnails(bool all);

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
    bool m_dragging = false;
    std::optional<int> m_draggingTouch;
    double m_grabOffset = 0;           ///< points from the finger to the play head while it is dragged
    std::int32_t m_thumbnailCount = 0; ///< as last asked for
    std::vector<double> m_timestamps;
    std::map<double, ImageRef> m_thumbnails;
};

} // namespace platform
