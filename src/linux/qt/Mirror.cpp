#include "linux/qt/Mirror.h"

#include "linux/qt/accessibility/ViewAccessible.h"

#include <utility>
#include <variant>

namespace qtui {

Mirror::Mirror(platform::Window& window, QQuickItem& root, Stage& stage, const base::Clock& clock)
    : m_window(window), m_root(root), m_stage(stage), m_clock(clock), m_focusRing(stage)
{
    m_focusRing.setParentItem(&root);
}

Mirror::~Mirror()
{
    m_affinity.assertHere();
}

bool Mirror::commit()
{
    m_affinity.assertHere();
    ++m_stage.statistics.commits;
    m_stage.painted.clear();
    m_messages.clear();
    m_animating = false;
    m_showsVideo = false;
    m_now = m_clock.now();
    visitView(m_window.window(), {&m_root, {}, 1, 0, false});
    removeStrays();
    showFocus();
    m_stage.painted.clear();
    for (ViewItem* item : std::exchange(m_created, {}))
        announceCreated(*item);
    return m_animating;
}

ViewItem* Mirror::itemFor(const platform::View& view) const
{
    m_affinity.assertHere();
    const auto found = m_peers.find(&view);
    auto* item = found == m_peers.end() ? nullptr : dynamic_cast<ViewItem*>(found->second.item.get());
    return item && item->view().get() == &view ? item : nullptr;
}

ViewItem& Mirror::peerOf(const std::shared_ptr<platform::View>& view)
{
    Peer& peer = m_peers[view.get()];
    auto* item = dynamic_cast<ViewItem*>(peer.item.get());
    // Another view may live where one has died.
    if (!item || item->view() != view) {
        auto made = makePeer(view, m_stage);
        item = made.get();
        peer.item = std::move(made);
        m_created.push_back(item);
    }
    peer.seen = m_stage.statistics.commits;
    return *item;
}

void Mirror::takeAnimations(platform::View& view, ViewItem& item) const
{
    for (const platform::PropertyAnimation& animation : view.takeAnimations()) {
        if (animation.property == platform::AnimatedProperty::Alpha)
            item.alphaTween().start(animation.fromAlpha, view.alpha(), m_now, animation.duration);
        else
            item.frameTween().start(animation.fromFrame, item.modelFrame(view), m_now, animation.duration);
    }
}

void Mirror::attach(PeerItem& item, const Above& above)
{
    if (item.parentItem() != above.item)
        item.setParentItem(above.item);
    item.setZ(above.order);
}

QRectF Mirror::visitView(const std::shared_ptr<platform::View>& view, const Above& above)
{
    ViewItem& item = peerOf(view);
    attach(item, above);
    takeAnimations(*view, item);
    const double alpha = item.alphaTween().shown(view->alpha(), m_now);
    const base::Rect frame = item.frameTween().shown(item.modelFrame(*view), m_now);
    m_animating = m_animating || item.alphaTween().isRunning() || item.frameTween().isRunning();

    const double wholeAlpha = view->isHidden() ? 0 : above.alpha * alpha;
    const bool visible = wholeAlpha > 0;
    const QPointF origin = item.place(toQRectF(frame), above.origin);
    const bool isGroup = alpha > 0 && alpha < 1 && !view->children().empty();
    item.setShown(view->isHidden(), alpha, above.inGroup);
    item.refresh(*view, visible);
    if (QColor color = toQColor(view->backgroundColor()); visible && color.alpha() > 0) {
        color.setAlphaF(color.alphaF() * static_cast<float>(wholeAlpha));
        m_stage.painted.push_back({item.windowRect(), color, nullptr});
    }

    const QRectF below = visitChildren(*view, {&item, origin, wholeAlpha, 0, above.inGroup || isGroup});
    const QRectF covered = view->clipsToBounds() ? item.windowRect() : item.drawnRect().united(below);
    if (isGroup && visible && !above.inGroup)
        item.showGroup(covered);
    else
        item.endGroup();
    return visible ? covered : QRectF();
}

QRectF Mirror::visitChildren(const platform::View& view, const Above& above)
{
    QRectF covered;
    Above each = above;
    for (const platform::View::Child& child : view.children()) {
        if (const auto* below = std::get_if<std::shared_ptr<platform::View>>(&child))
            covered = covered.united(visitView(*below, each));
        else
            covered = covered.united(visitLayer(std::get<std::shared_ptr<platform::Layer>>(child), each));
        ++each.order;
    }
    return covered;
}

QRectF Mirror::visitLayer(const std::shared_ptr<platform::Layer>& layer, const Above& above)
{
    const auto playerLayer = std::dynamic_pointer_cast<platform::PlayerLayer>(layer);
    if (!playerLayer)
        return {};
    Peer& peer = m_peers[layer.get()];
    auto* item = dynamic_cast<VideoItem*>(peer.item.get());
    if (!item || item->layer() != playerLayer) {
        auto made = std::make_unique<VideoItem>(playerLayer, m_stage);
        item = made.get();
        peer.item = std::move(made);
    }
    peer.seen = m_stage.statistics.commits;
    attach(*item, above);
    item->place(toQRectF(layer->frame()), above.origin);
    const bool visible = above.alpha > 0;
    item->setShown(false, 1, above.inGroup);
    item->refresh(*playerLayer, visible);
    if (!item->message().isEmpty())
        m_messages.push_back(item);
    if (visible) {
        m_stage.painted.push_back({item->windowRect(), Qt::black, nullptr});
        m_stage.painted.push_back({item->windowRect(), {}, item});
        m_showsVideo = m_showsVideo || !item->picture().isNull();
    }
    return visible ? item->drawnRect() : QRectF();
}

void Mirror::removeStrays()
{
    std::erase_if(m_peers, [this](const auto& peer) {
        if (peer.second.seen == m_stage.statistics.commits)
            return false;
        if (auto* item = dynamic_cast<ViewItem*>(peer.second.item.get()))
            announceRemoved(*item);
        return true;
    });
}

void Mirror::showFocus()
{
    const auto focused = m_window.focusedView();
    bool visible = focused != nullptr;
    for (auto view = focused; view; view = view->superview())
        visible = visible && !view->isHidden() && view->alpha() > 0;
    const ViewItem* item = visible ? itemFor(*focused) : nullptr;
    m_focusRing.showAround(item ? item->windowRect() : QRectF(), toQRectF(m_window.bounds()));
}

} // namespace qtui
