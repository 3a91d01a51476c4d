#include "platform/sharing/ShareSummary.h"

#include "platform/sharing/QuietText.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

constexpr double kMargin = 16;
constexpr double kPictureSize = 72;
/// Pixels; the picture fills its square on the sharpest screens.
constexpr double kPicturePixels = 288;
constexpr double kColumnGap = 12;
constexpr double kLineGap = 4;
constexpr double kTextGap = 12;
constexpr double kNameSize = 17;
constexpr double kSmallSize = 14;
constexpr double kTextSize = 15;
constexpr int kNameLines = 2;
constexpr int kFilesLines = 2;
constexpr int kTextLines = 3;
/// Names of more files than that nobody reads.
constexpr std::size_t kMostNames = 5;
/// The text's colour, stepped back; still 4.5:1 or more on a sheet.
constexpr Color kSecondary{0, 0, 0, 0.7};
/// Where the picture will be, in both schemes.
constexpr Color kEmptyPicture{0.5, 0.5, 0.5, 0.25};

double lineHeight(const View& view, double fontSize)
{
    return textMeasuringFor(view).heightOf("0", {fontSize, false}, kPictureSize, 1);
}

void setUp(Label& label, double size, int lines, Color color)
{
    label.setFontSize(size);
    label.setNumberOfLines(lines);
    label.setTextColor(color);
    label.setTextAlignment(TextAlignment::Leading);
}

} // namespace

ShareSummary::ShareSummary(const Services& services, const ShareItems& items, const std::string& name)
    : m_services(services)
{
    std::vector<base::Url> files = filesOf(items);
    if (!files.empty()) {
        m_movie = files.front();
        files.erase(files.begin());
    }
    setUp(*m_name, kNameSize, kNameLines, Color::black());
    m_name->setEmphasized(true);
    m_name->setText(quietText(name));
    setUp(*m_details, kSmallSize, 1, kSecondary);
    setUp(*m_files, kSmallSize, kFilesLines, kSecondary);
    setUp(*m_text, kTextSize, kTextLines, Color::black());
    m_text->setText(quietText(textOf(items)));
    std::vector<std::string> names;
    for (const base::Url& file : files)
        if (names.size() < kMostNames)
            names.push_back(quietName(file.lastPathComponent()));
    if (!names.empty())
        m_files->setText(m_services.words.text("SHARE_ALONG", {{"names", m_services.words.list(names)}}));
    m_pictureFrame->setBackgroundColor(kEmptyPicture);
    m_pictureFrame->setClipsToBounds(true);
}

void ShareSummary::didMoveToWindow()
{
    if (m_name->superview())
        return;
    addSubview(m_pictureFrame);
    for (const auto& label : {m_name, m_details, m_files, m_text}) {
        label->setHidden(label->text().empty());
        addSubview(label);
    }
}

void ShareSummary::load()
{
    assertHere();
    if (!m_movie)
        return;
    loadSize();
    loadMovie();
}

void ShareSummary::loadSize()
{
    // Even a look at a file can take its time: it may lie on another machine.
    m_services.files.system().defaultQueue.post([&files = m_services.files, &main = m_services.mainQueue,
                                                 path = m_movie->path(), weak = weakSelf<ShareSummary>()] {
        const auto attributes = files.attributesOfItem(path);
        if (!attributes)
            return;
        main.post([weak, size = attributes.value().size] {
            if (const auto self = weak.lock()) {
                self->m_bytes = size;
                self->showDetails();
            }
        });
    });
}

void ShareSummary::loadMovie()
{
    m_asset = m_services.media.assetWithURL(m_movie);
    const auto weak = weakSelf<ShareSummary>();
    m_asset->whenLoaded([weak] {
        const auto self = weak.lock();
        if (self && self->m_asset->duration().isNumeric()) {
            self->m_seconds = self->m_asset->duration().seconds();
            self->showDetails();
        }
    });
    m_generator = m_services.media.imageGeneratorWithAsset(m_asset);
    m_generator->setMaximumSize({kPicturePixels, kPicturePixels});
    m_generator->generateImagesAsynchronouslyForTimes(
        {base::MediaTime::zero()},
        [weak, &main = m_services.mainQueue](base::MediaTime, const ImageRef& image, base::MediaTime,
                                             ImageGenerator::Result, const base::ErrorRef&) {
            main.post([weak, image] {
                const auto self = weak.lock();
                if (self && image)
                    self->showPicture(image);
            });
        });
}

void ShareSummary::showPicture(const ImageRef& image)
{
    m_picture = std::make_shared<ImageView>(image);
    m_pictureFrame->addSubview(m_picture);
    // It fills the square; what is over is cut off, the same on both sides.
    const base::Size size = image->size();
    const double least = std::max(1.0, std::min(size.width, size.height));
    const double width = size.width / least * kPictureSize;
    const double height = size.height / least * kPictureSize;
    m_picture->setFrame(base::Rect::make((kPictureSize - width) / 2, (kPictureSize - height) / 2, width, height));
}

void ShareSummary::showDetails()
{
    const MessageCatalog& words = m_services.words;
    const std::string size = m_bytes ? words.fileSize(*m_bytes) : "";
    if (m_seconds && m_bytes) {
        m_details->setText(words.text("SHARE_DETAILS", {{"length", words.clock(*m_seconds)}, {"size", size}}));
        m_details->setAccessibilityLabel(
            words.text("SHARE_DETAILS_SPOKEN", {{"length", words.duration(*m_seconds, 0)}, {"size", size}}));
    } else if (m_seconds) {
        m_details->setText(words.clock(*m_seconds));
        m_details->setAccessibilityLabel(words.duration(*m_seconds, 0));
    } else {
        m_details->setText(size);
    }
    m_details->setHidden(m_details->text().empty());
}

void ShareSummary::setTrailingInset(double inset)
{
    assertHere();
    m_trailingInset = inset;
    setNeedsLayout();
}

ShareSummary::Heights ShareSummary::heightsFor(double width) const
{
    const double column = width - kMargin - kPictureSize - kColumnGap;
    Heights heights;
    heights.name = m_name->heightThatFits(column - std::max(kMargin, m_trailingInset));
    heights.files = m_files->text().empty() ? 0 : m_files->heightThatFits(column - kMargin);
    heights.text = m_text->text().empty() ? 0 : m_text->heightThatFits(width - 2 * kMargin);
    // The line of the details is kept for them: they come a little later.
    double beside = heights.name + kLineGap + lineHeight(*this, kSmallSize);
    if (heights.files > 0)
        beside += kLineGap + heights.files;
    heights.head = std::max(kPictureSize, beside);
    return heights;
}

double ShareSummary::heightThatFits(double width) const
{
    assertHere();
    const Heights heights = heightsFor(width);
    return kMargin + heights.head + (heights.text > 0 ? kTextGap + heights.text : 0) + kTextGap;
}

void ShareSummary::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    const double width = bounds().width();
    const Heights heights = heightsFor(width);
    const auto itsWindow = window();
    const bool rightToLeft = itsWindow && itsWindow->isRightToLeft();
    const auto place = [&](const std::shared_ptr<View>& view, double start, double end, double y, double height) {
        view->setFrame(base::Rect::make(rightToLeft ? width - end : start, y, std::max(0.0, end - start), height));
    };
    place(m_pictureFrame, kMargin, kMargin + kPictureSize, kMargin, kPictureSize);
    const double start = kMargin + kPictureSize + kColumnGap;
    double y = kMargin;
    place(m_name, start, width - std::max(kMargin, m_trailingInset), y, heights.name);
    y += heights.name + kLineGap;
    const double line = lineHeight(*this, kSmallSize);
    place(m_details, start, width - kMargin, y, line);
    y += line + kLineGap;
    place(m_files, start, width - kMargin, y, heights.files);
    place(m_text, kMargin, width - kMargin, kMargin + heights.head + kTextGap, heights.text);
}

} // namespace platform
