#include "Stage.h"

#include "support/EventLoop.h"

#include <QDir>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <cstring>

namespace tests {

namespace {

std::unique_ptr<QGuiApplication> s_application;
double s_scale = 0;

/// One application at a time: another scale needs another one.
void haveApplication(double scale)
{
    if (s_scale == scale)
        return;
    s_application.reset();
    qputenv("QT_SCALE_FACTOR", QByteArray::number(scale));
    static int argc = 1;
    static char name[] = "tests-linux-qt";
    static char* argv[] = {name, nullptr};
    s_application = std::make_unique<QGuiApplication>(argc, argv);
    QGuiApplication::setQuitOnLastWindowClosed(false);
    s_scale = scale;
}

double luminance(const QColor& color)
{
    const auto linear = [](double value) {
        return value <= 0.04045 ? value / 12.92 : std::pow((value + 0.055) / 1.055, 2.4);
    };
    return 0.2126 * linear(color.redF()) + 0.7152 * linear(color.greenF()) + 0.0722 * linear(color.blueF());
}

} // namespace

void endApplication()
{
    s_application.reset();
}

bool QuarteredFrame::render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height,
                            Quality quality) const
{
    renders.push_back(quality);
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            const bool left = x < width / 2;
            const bool top = y < height / 2;
            const std::uint32_t color = top ? (left ? 0xffff0000U : 0xff00ff00U) : (left ? 0xff0000ffU : 0xffffffffU);
            std::memcpy(bgra + y * bytesPerRow + std::ptrdiff_t{4} * x, &color, 4);
        }
    return true;
}

const runtime::Class& Target::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<Target>("TestTarget", &Object::classObject()).method("act:", &Target::act).build();
    return instance;
}

void TouchedView::note(const char* what, const platform::Touch& touch)
{
    const base::Point at = convertFromRoot(touch.position);
    touches.push_back(std::string(what) + " " + std::to_string(std::lround(at.x)) + ","
                      + std::to_string(std::lround(at.y)));
    ids.push_back(touch.id);
}

std::vector<double> Movie::movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(platform::MovieScrubber&,
                                                                                    std::int32_t count, double start,
                                                                                    double end)
{
    std::vector<double> timestamps;
    timestamps.reserve(static_cast<std::size_t>(std::max(count, 0)));
    for (std::int32_t i = 0; i < count; ++i)
        timestamps.push_back(start + (end - start) * i / count);
    return timestamps;
}

Stage::Stage(double wantedScale) : scale(wantedScale)
{
    haveApplication(scale);
    window = std::make_shared<platform::Window>(mainQueue, base::Size{200, 100}, scale);
    presenter = std::make_unique<qtui::Presenter>(window, clock, words);
    presenter->setScheme(qtui::Scheme::Light);
    presenter->show();
    settle();
}

Stage::~Stage() = default;

std::shared_ptr<platform::View> Stage::addColor(base::Rect frame, platform::Color color)
{
    auto view = add<platform::View>(frame);
    view->setBackgroundColor(color);
    return view;
}

std::shared_ptr<FakePlayer> Stage::addPlayer(base::Rect frame, platform::VideoFrameRef picture,
                                             std::shared_ptr<FakePlayerItem> item)
{
    auto player = std::make_shared<FakePlayer>(mainQueue, center, std::move(item));
    const auto layer = platform::PlayerLayer::withPlayer(player);
    layer->setFrame(frame);
    window->addSublayer(layer);
    player->show(std::move(picture));
    return player;
}

void Stage::settle()
{
    for (int i = 0; i < 5; ++i) {
        mainQueue.drain();
        QCoreApplication::processEvents();
    }
}

bool Stage::settleUntil(const std::function<bool()>& done)
{
    settle();
    return pumpUntil(mainQueue, done);
}

void Stage::resize(base::Size size)
{
    presenter->quickWindow().resize(static_cast<int>(size.width), static_cast<int>(size.height));
    settleUntil([&] { return window->View::bounds().size == size; });
}

QImage Stage::look()
{
    return presenter->grab();
}

QColor Stage::colorAt(double x, double y)
{
    return look().pixelColor(static_cast<int>(x * scale), static_cast<int>(y * scale));
}

int Stage::inkIn(base::Rect rect)
{
    const QImage image = look();
    const auto pixel = [this](double points) { return static_cast<int>(std::lround(points * scale)); };
    const QRgb ground = image.pixel(pixel(rect.minX()), pixel(rect.minY()));
    int ink = 0;
    for (int y = pixel(rect.minY()); y < pixel(rect.maxY()); ++y)
        for (int x = pixel(rect.minX()); x < pixel(rect.maxX()); ++x)
            ink += image.pixel(x, y) != ground ? 1 : 0;
    return ink;
}

void Stage::keep(const std::string& name)
{
    if (const char* directory = std::getenv("CLIPSA_GRABS"))
        look().save(QDir(QString::fromLocal8Bit(directory)).filePath(QString::fromStdString(name) + ".png"));
}

double contrast(const QColor& a, const QColor& b)
{
    const double lighter = std::max(luminance(a), luminance(b));
    const double darker = std::min(luminance(a), luminance(b));
    return (lighter + 0.05) / (darker + 0.05);
}

} // namespace tests
