/// The peer of one view: shows what the view looks like. Made, changed and ended on the GUI thread.
///
/// The mirror owns the peers and calls `place` and `refresh` for each one in every commit; a peer draws anew only when
/// something that it shows has changed.
#pragma once

#include "linux/qt/animation/Tween.h"
#include "linux/qt/items/Sprite.h"
#include "linux/qt/items/Stage.h"
#include "platform/views/View.h"

#include <memory>

namespace qtui {

/// The peer of a view, or of a bare layer.
class PeerItem : public SpriteItem {
public:
    explicit PeerItem(Stage& stage) : m_stage(stage) {}

    /// Puts the item on `frame`, in the parent item's coordinates of the model. The window coordinates of the parent's
    /// origin make it land on whole pixels. Gives its own origin in window coordinates.
    QPointF place(const QRectF& frame, QPointF parentOrigin);
    /// What it covers now, in window coordinates.
    QRectF windowRect() const { return {m_origin, m_size}; }
    QSizeF shownSize() const { return m_size; }
    /// What it covers and draws, in window coordinates; can reach beyond its frame.
    QRectF drawnRect() const;

    /// Fades as one thing: children do not show through each other. Costs a texture while it is between 0 and 1.
    void setShownAlpha(double alpha, bool hasChildren);
    /// Takes children that reach beyond the frame into what fades.
    void setGroupRect(const QRectF& rectInOwnCoordinates);
    bool isGrouped() const { return m_grouped; }

protected:
    Stage& stage() const { return m_stage; }
    QRectF ownRect() const { return {QPointF(), m_size}; }

private:
    void setGrouped(bool grouped);
    void applyGeometry();
    QPointF shift() const;

    Stage& m_stage;
    QPointF m_origin;
    QPointF m_position; ///< relative to the parent's origin
    QSizeF m_size;
    QRectF m_groupRect; ///< own coordinates; null outside a group fade
    bool m_grouped = false;
};

class ViewItem : public PeerItem {
public:
    ViewItem(const std::shared_ptr<platform::View>& view, Stage& stage) : PeerItem(stage), m_view(view) {}

    std::shared_ptr<platform::View> view() const { return m_view.lock(); }

    /// Where the model puts it, in the superview's coordinates.
    virtual base::Rect modelFrame(const platform::View& view) const { return view.frame(); }
    Tween<double>& alphaTween() { return m_alphaTween; }
    Tween<base::Rect>& frameTween() { return m_frameTween; }

    /// Draws anew if it has to. `visible`: some of it can be seen.
    void refresh(platform::View& view, bool visible);

protected:
    /// What it looks like now.
    virtual std::vector<Sprite> draw(platform::View& view);
    /// Whether something beyond the view's revision and size changed what it looks like. Asked once a commit.
    virtual bool needsDrawing(platform::View&, bool /*visible*/) { return false; }

private:
    std::weak_ptr<platform::View> m_view;
    Tween<double> m_alphaTween;
    Tween<base::Rect> m_frameTween;
    std::uint64_t m_revision = 0;
    std::uint64_t m_generation = 0;
    QSizeF m_drawnSize;
};

/// The peer that fits the kind of view.
std::unique_ptr<ViewItem> makePeer(const std::shared_ptr<platform::View>& view, Stage& stage);

} // namespace qtui
