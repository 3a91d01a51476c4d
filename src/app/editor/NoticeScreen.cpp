#include "app/editor/NoticeScreen.h"

#include "linux/icu/LineBreaking.h"
#include "platform/views/Color.h"

#include <utility>

namespace app {

using platform::BarButtonItem;
using platform::Label;
using runtime::Selector;

namespace {

constexpr int kColumns = 38;       // of letters, as many as fit on a narrow phone
constexpr double kFontSize = 15;   // points
constexpr double kLineHeight = 24; // points
constexpr double kMargin = 16;     // points, on either side of a line
constexpr platform::Color kWordsColor{1, 1, 1, 1};
// Points; as high as the editor's own upper bar, so that its button stays where it is.
constexpr double kBarHeight = 60;
constexpr double kBarHeightWithoutHomeButton = 85;

} // namespace

NoticeScreen::NoticeScreen(const platform::MessageCatalog& words, std::string text, bool hasHomeButton,
                           Handlers handlers)
    : m_words(words), m_text(std::move(text)), m_barHeight(hasHomeButton ? kBarHeight : kBarHeightWithoutHomeButton),
      m_handlers(std::move(handlers))
{
}

const runtime::Class& NoticeScreen::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<NoticeScreen>("NoticeScreen", &ViewController::classObject())
            .method("close", &NoticeScreen::close)
            .build();
    return instance;
}

void NoticeScreen::loadView()
{
    assertHere();
    ViewController::loadView();
    view()->setBackgroundColor(platform::Color::black());
    for (const std::string& line : intl::brokenIntoLines(m_text, kColumns)) {
        const auto label = std::make_shared<Label>();
        label->setText(line);
        label->setFontSize(kFontSize);
        label->setTextColor(kWordsColor);
        label->setTextAlignment(platform::TextAlignment::Center);
        view()->addSubview(label);
        m_lines.push_back(label);
    }
    m_bar = std::make_shared<platform::Toolbar>();
    m_bar->setItems({std::make_shared<BarButtonItem>(m_words, BarButtonItem::Kind::Cancel, weakSelf<runtime::Object>(),
                                                     Selector("close")),
                     BarButtonItem::flexibleSpace()});
    view()->addSubview(m_bar);
}

void NoticeScreen::viewWillAppear(bool animated)
{
    assertHere();
    becomeFirstResponder();
    ViewController::viewWillAppear(animated);
}

void NoticeScreen::viewDidLayoutSubviews()
{
    assertHere();
    ViewController::viewDidLayoutSubviews();
    const base::Rect bounds = view()->bounds();
    m_bar->setFrame(base::Rect::make(0, 0, bounds.width(), m_barHeight));
    double y = (bounds.height() - kLineHeight * static_cast<double>(m_lines.size())) / 2;
    for (const auto& label : m_lines) {
        label->setFrame(base::Rect::make(kMargin, y, bounds.width() - 2 * kMargin, kLineHeight));
        y += kLineHeight;
    }
    if (m_handlers.resized)
        m_handlers.resized(bounds);
}

std::vector<platform::KeyCommand> NoticeScreen::keyCommands() const
{
    assertHere();
    return {{platform::Key::Escape, 0, false, Selector("close")}};
}

void NoticeScreen::close()
{
    assertHere();
    if (m_handlers.closed)
        m_handlers.closed();
}

} // namespace app
