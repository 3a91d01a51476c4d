/// Keeps one item for each view and layer of a window's tree, in the tree's order. GUI thread.
///
/// An item lives as long as its view is in the tree; views are told apart by identity, not by place.
#pragma once

#include "base/Affinity.h"
#include "base/Clock.h"
#include "linux/qt/items/FocusRing.h"
#include "linux/qt/items/VideoItem.h"
#include "linux/qt/items/ViewItem.h"
#include "platform/views/Window.h"

#include <memory>
#include <unordered_map>
#include <vector>

namespace qtui {

class Mirror {
public:
    /// All of them outlive this.
    Mirror(platform::Window& window, QQuickItem& root, Stage& stage, const base::Clock& clock);
    ~Mirror();

    /// Makes the items what the tree is now. Gives whether animations are still on their way.
    bool commit();

    /// Null when the view is not in the tree.
    ViewItem* itemFor(const platform::View& view) const;
    std::size_t itemCount() const
    {
        m_affinity.assertHere();
        return m_peers.size();
    }
    /// The videos that said something at the last commit, those behind first.
    const std::vector<VideoItem*>& messages() const
    {
        m_affinity.assertHere();
        return m_messages;
    }
    /// Whether a picture of a video could be seen at the last commit.
    bool showsVideo() const
    {
        m_affinity.assertHere();
        return m_showsVideo;
    }

private:
    struct Peer {
        std::unique_ptr<PeerItem> item;
        std::uint64_t seen = 0; ///< the commit that met it last
    };
    /// What a branch of the tree needs to know of what is above it.
    struct Above {
        QQuickItem* item;
        QPointF origin;       ///< window coordinates
        double alpha = 1;     ///< of all that is above
        double order = 0;     ///< among its siblings
        bool inGroup = false; ///< something above draws it
    };

    /// Both give what the branch covers, in window coordinates; nothing when none of it can be seen.
    QRectF visitView(const std::shared_ptr<platform::View>& view, const Above& above);
    QRectF visitLayer(const std::shared_ptr<platform::Layer>& layer, const Above& above);
    QRectF visitChildren(const platform::View& view, const Above& above);
    ViewItem& peerOf(const std::shared_ptr<platform::View>& view);
    void takeAnimations(platform::View& view, ViewItem& item) const;
    void attach(PeerItem& item, const Above& above);
    void removeStrays();
    void showFocus();

    platform::Window& m_window;
    QQuickItem& m_root;
    Stage& m_stage;
    const base::Clock& m_clock;
    std::unordered_map<const void*, Peer> m_peers;
    std::vector<ViewItem*> m_created; ///< in the commit that is running
    std::vector<VideoItem*> m_messages;
    FocusRing m_focusRing;
    base::Instant m_now{0};
    bool m_animating = false;
    bool m_showsVideo = false;
    base::Affinity m_affinity;
};

} // namespace qtui
