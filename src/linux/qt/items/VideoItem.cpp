#include "linux/qt/items/VideoItem.h"

#include "linux/qt/items/Text.h"

#include <QPainter>

#include <algorithm>
#include <cmath>

namespace qtui {

using Quality = platform::VideoFrame::Quality;

namespace {

// What is said in place of a picture, in points.
constexpr double kWordsWidth = 420;
constexpr double kWordsHeight = 120;
constexpr double kWordsMargin = 24;
constexpr double kWordsSize = 15;
const QColor kWordsColor(255, 255, 255, 222);

// What is said over a picture, in points: on a plate below the upper bar, which is 85 high where it is highest.
constexpr double kNoticeTop = 97;
constexpr double kNoticeSize = 13;
constexpr double kNoticePadding = 10;
constexpr double kNoticeRounding = 10;
const QColor kPlateColor(0, 0, 0, 190); // white is readable on it also where the picture is white

std::string failureText(const platform::PlayerLayer& layer, const platform::MessageCatalog& words)
{
    if (!layer.hasFailed())
        return {};
    const base::ErrorRef why = layer.failure();
    return why ? platform::wordsFor(*why, words) : words.text("NOTICE_CANNOT_PLAY");
}

std::string noticeText(const platform::PlayerLayer& layer, const platform::MessageCatalog& words)
{
    constexpr int kDecimals = 1; // of the seconds
    const auto cut = layer.notice();
    if (!cut)
        return {};
    const std::string rest = words.duration(cut->seconds, kDecimals);
    if (!cut->secondsBefore)
        return words.text("NOTICE_CUT_OFF", {{"rest", rest}});
    return words.text("NOTICE_CUT_OFF_FROM",
                      {{"duration", words.duration(*cut->secondsBefore, kDecimals)}, {"rest", rest}});
}

} // namespace

void VideoItem::refresh(platform::PlayerLayer& layer, bool visible)
{
    assertHere();
    m_isSeen = visible;
    if (!visible)
        return;
    const platform::VideoFrameRef frame = layer.currentFrame();
    const base::Rect fitted = layer.videoRect(base::Rect::make(0, 0, shownSize().width(), shownSize().height()));
    const Quality quality = layer.player() && layer.player()->isPlaying() ? Quality::Fast : Quality::Exact;
    const QRectF wanted = toQRectF(fitted);
    const QRectF rect(stage().snapped(wanted.topLeft()), stage().snapped(wanted.bottomRight()));
    const QSize size(static_cast<int>(std::lround(rect.width() * stage().scale)),
                     static_cast<int>(std::lround(rect.height() * stage().scale)));
    const bool showable = frame && !size.isEmpty();
    // A picture that rests is worth converting again when it was converted in haste.
    const bool good = m_frame == frame && m_picture.size() == size && m_quality >= quality;
    const QString words = frame ? QString() : QString::fromStdString(failureText(layer, stage().words));
    const QString notice = frame ? QString::fromStdString(noticeText(layer, stage().words)) : QString();
    if (good && m_pictureRect == rect && m_shownSize == shownSize() && m_words == words && m_notice == notice)
        return;
    if (!good) {
        m_frame = frame;
        m_picture = {};
        if (showable && convert(*frame, size, quality))
            m_quality = quality;
    }
    m_pictureRect = m_picture.isNull() ? QRectF() : rect;
    m_shownSize = shownSize();
    m_words = words;
    m_notice = notice;
    std::vector<Sprite> sprites{{ownRect(), Qt::black, {}, false}, {m_pictureRect, {}, m_picture, false}};
    if (!words.isEmpty())
        sprites.push_back(paintedSprite(ownRect(), stage().scale, [&](QPainter& painter) { drawWords(painter); }));
    if (!notice.isEmpty())
        sprites.push_back(paintedSprite(ownRect(), stage().scale, [&](QPainter& painter) { drawNotice(painter); }));
    setSprites(std::move(sprites));
}

void VideoItem::drawNotice(QPainter& painter) const
{
    constexpr int kLines = Qt::AlignHCenter | Qt::AlignTop | Qt::TextWordWrap;
    const double width = std::min(kWordsWidth, ownRect().width() - 2 * (kWordsMargin + kNoticePadding));
    QRectF column(0, kNoticeTop + kNoticePadding, std::max(0.0, width), ownRect().height());
    column.moveLeft(ownRect().center().x() - column.width() / 2);
    painter.setFont(systemFont(kNoticeSize));
    const QRectF text = painter.boundingRect(column, kLines, m_notice);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    painter.setBrush(kPlateColor);
    painter.drawRoundedRect(text.adjusted(-kNoticePadding, -kNoticePadding, kNoticePadding, kNoticePadding),
                            kNoticeRounding, kNoticeRounding);
    painter.setPen(Qt::white);
    painter.drawText(text, kLines, m_notice);
}

void VideoItem::drawWords(QPainter& painter) const
{
    const double width = std::min(kWordsWidth, ownRect().width() - 2 * kWordsMargin);
    QRectF column(0, 0, std::max(0.0, width), kWordsHeight);
    // Above the middle, where the play button may stand.
    column.moveCenter({ownRect().center().x(), ownRect().center().y() - kWordsHeight});
    painter.setFont(systemFont(kWordsSize));
    painter.setPen(kWordsColor);
    painter.drawText(column, Qt::AlignHCenter | Qt::AlignBottom | Qt::TextWrapAnywhere | Qt::TextWordWrap, m_words);
}

bool VideoItem::convert(const platform::VideoFrame& frame, QSize size, Quality quality)
{
    QImage& buffer = freeBuffer(size);
    ++stage().statistics.pictures;
    if (!frame.render(buffer.bits(), buffer.bytesPerLine(), size.width(), size.height(), quality))
        return false;
    m_picture = buffer;
    return true;
}

QImage& VideoItem::freeBuffer(QSize size)
{
    const auto isFree = [&](const QImage& buffer) { return buffer.size() == size && buffer.isDetached(); };
    auto found = std::find_if(m_buffers.begin(), m_buffers.end(), isFree);
    if (found == m_buffers.end()) {
        // In turn, so that the one given up is the oldest; who still shows it keeps its pixels alive.
        std::rotate(m_buffers.begin(), m_buffers.begin() + 1, m_buffers.end());
        found = m_buffers.end() - 1;
        *found = QImage(size, QImage::Format_RGB32);
    }
    return *found;
}

} // namespace qtui
