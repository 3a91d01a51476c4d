/// Shows a player's picture, fitted into the layer's frame, black around it. GUI thread.
///
/// Where there is no picture because the movie cannot be played, it says why.
/// A picture is converted once for each size that it is shown in: quickly while it plays, exactly when it rests.
#pragma once

#include "linux/qt/items/ViewItem.h"
#include "platform/media/PlayerLayer.h"

#include <array>

namespace qtui {

class VideoItem final : public PeerItem {
public:
    VideoItem(const std::shared_ptr<platform::PlayerLayer>& layer, Stage& stage) : PeerItem(stage), m_layer(layer) {}

    std::shared_ptr<platform::PlayerLayer> layer() const { return here(m_layer).lock(); }

    /// Fetches the player's picture when it is another one. Nothing is converted while nobody can see it.
    void refresh(platform::PlayerLayer& layer, bool visible);

    /// What is said over the picture or in its place, where it can be seen; else empty.
    QString message() const { return !here(m_isSeen) ? QString() : m_words.isEmpty() ? m_notice : m_words; }
    /// As it was last converted; null until there was one.
    const QImage& picture() const { return here(m_picture); }
    /// Where it stands, in window coordinates.
    QRectF pictureRect() const { return here(m_pictureRect).translated(windowRect().topLeft()); }

private:
    bool convert(const platform::VideoFrame& frame, QSize size, platform::VideoFrame::Quality quality);
    QImage& freeBuffer(QSize size);
    void drawWords(QPainter& painter) const;
    void drawNotice(QPainter& painter) const;

    std::weak_ptr<platform::PlayerLayer> m_layer;
    platform::VideoFrameRef m_frame; ///< of the picture
    platform::VideoFrame::Quality m_quality = platform::VideoFrame::Quality::Fast;
    QImage m_picture;
    QRectF m_pictureRect;
    QSizeF m_shownSize;
    bool m_isSeen = false;
    QString m_words;  ///< what is said in place of a picture
    QString m_notice; ///< what is said over it
    /// The scene still reads the last picture while the next one is converted.
    std::array<QImage, 3> m_buffers;
};

} // namespace qtui
