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
    QRectF windowRect() const { return {here(m_origin), m_size}; }
    QSizeF shownSize() const { return here(m_size); }
    /// What it covers and draws, in window coordinates; can reach beyond its frame.
    QRectF drawnRect() const;

    /// Whether it takes part in the picture at all, and how opaque it is there.
    void setShown(bool hidden, double alpha, bool standsInGroup);

    /// Draws itself and all that is below as one picture, so that they fade as one thing: nothing shows through. The
    /// items below are to be placed with `standsInGroup`. `windowRect` is what all of them cover.
    void showGroup(const QRectF& windowRect);
    void endGroup();

protected:
    Stage& stage() const { return m_stage; }
    QRectF ownRect() const { return {QPointF(), m_size}; }

private:
    /// Of something that was drawn into a group's picture.
    struct Ingredient {
        QRectF rect;
        QRgb color = 0;
        qint64 picture = 0;
        double alpha = 1;
        friend bool operator==(const Ingredient&, const Ingredient&) = default;
    };

    std::vector<PeerItem*> peersBelow() const;
    void collect(std::vector<Ingredient>& ingredients) const;
    void paint(QPainter& painter, const QRectF& windowRect) const;
    void paintWithAlpha(QPainter& painter, const QRectF& windowRect) const;
    QImage painted(const QRectF& windowRect) const;

    Stage& m_stage;
    QPointF m_origin;
    QSizeF m_size;
    double m_alpha = 1;
    bool m_hidden = false;
    std::vector<Ingredient> m_ingredients; ///< of the group's picture, while there is one
};

class ViewItem : public PeerItem {
public:
    ViewItem(const std::shared_ptr<platform::View>& view, Stage& stage) : PeerItem(stage), m_view(view) {}

    std::shared_ptr<platform::View> view() const { return here(m_view).lock(); }

    /// Where the model puts it, in the superview's coordinates.
    virtual base::Rect modelFrame(const platform::View& view) const { return view.frame(); }
    Tween<double>& alphaTween() { return here(m_alphaTween); }
    Tween<base::Rect>& frameTween() { return here(m_frameTween); }

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
