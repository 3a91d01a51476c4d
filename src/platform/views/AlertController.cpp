#include "platform/views/AlertController.h"

#include "platform/views/SurfaceView.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace platform {

namespace {

constexpr double kPadding = 20;
constexpr double kSpacing = 8;
constexpr double kButtonHeight = 44;
constexpr double kTitleSize = 17;
constexpr double kMessageSize = 15;
constexpr int kTitleLines = 3;
/// More than that nobody reads in an alert, and its buttons have to stay on the screen.
constexpr int kMessageLines = 10;
/// On both sides of a button's title, where two stand side by side.
constexpr double kButtonPadding = 12;

const runtime::Selector& pressedSelector()
{
    static const runtime::Selector selector("buttonPressed:");
    return selector;
}

const runtime::Selector& confirmSelector()
{
    static const runtime::Selector selector("confirm");
    return selector;
}

std::shared_ptr<Label> centredLabel(const std::string& text, double size, int lines)
{
    auto label = std::make_shared<Label>();
    label->setText(text);
    label->setFontSize(size);
    label->setNumberOfLines(lines);
    label->setTextAlignment(TextAlignment::Center);
    return label;
}

} // namespace

AlertController::AlertController(std::string title, std::string message) : m_message(std::move(message))
{
    setTitle(std::move(title));
    setModalPresentationStyle(ModalPresentationStyle::Alert);
}

const runtime::Class& AlertController::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<AlertController>("AlertController", &ViewController::classObject())
            .method(pressedSelector().name(), &AlertController::buttonPressed)
            .method(confirmSelector().name(), &AlertController::confirm)
            .build();
    return instance;
}

const runtime::Class& AlertController::isa() const
{
    return classObject();
}

void AlertController::addAction(AlertAction action)
{
    assertHere();
    assert(!isViewLoaded());
    m_actions.push_back(std::move(action));
}

void AlertController::viewDidLoad()
{
    assertHere();
    m_titleLabel = centredLabel(title(), kTitleSize, kTitleLines);
    m_titleLabel->setEmphasized(true);
    m_messageLabel = centredLabel(m_message, kMessageSize, kMessageLines);
    m_messageLabel->setHidden(m_message.empty());
    view()->addSubview(m_titleLabel);
    view()->addSubview(m_messageLabel);
    const auto preferred = indexOf(AlertAction::Style::Default);
    for (std::size_t i = 0; i < m_actions.size(); ++i) {
        const AlertAction& action = m_actions[i];
        const auto button = std::make_shared<Button>();
        button->setTitle(action.title);
        button->setEmphasized(preferred == i || m_actions.size() == 1);
        button->setDestructive(action.style == AlertAction::Style::Destructive);
        button->addTarget(weakSelf<runtime::Object>(), pressedSelector(), kTouchUpInside);
        m_separators.push_back(std::make_shared<SurfaceView>(SurfaceView::Style::Separator));
        view()->addSubview(m_separators.back());
        view()->addSubview(button);
        m_buttons.push_back(button);
    }
}

double AlertController::textHeight(double width) const
{
    const double room = width - 2 * kPadding;
    const double message = m_message.empty() ? 0 : kSpacing + m_messageLabel->heightThatFits(room);
    return 2 * kPadding + m_titleLabel->heightThatFits(room) + message;
}

bool AlertController::buttonsStandInARow(double width) const
{
    const TextMeasuring& measuring = textMeasuringFor(*m_titleLabel);
    return m_buttons.size() == 2 && std::all_of(m_buttons.begin(), m_buttons.end(), [&](const auto& button) {
               return measuring.widthOf(button->title(), {kTitleSize, true}) + 2 * kButtonPadding <= width / 2;
           });
}

base::Size AlertController::contentSizeThatFits(base::Size room)
{
    assertHere();
    view();
    const double rows = buttonsStandInARow(room.width) ? 1 : static_cast<double>(m_buttons.size());
    return {room.width, std::min(room.height, textHeight(room.width) + rows * kButtonHeight)};
}

void AlertController::viewDidLayoutSubviews()
{
    assertHere();
    const base::Size size = view()->bounds().size;
    const auto itsWindow = window();
    const double hairline = itsWindow ? 1 / itsWindow->scale() : 1;
    const double room = size.width - 2 * kPadding;
    const double titleHeight = m_titleLabel->heightThatFits(room);
    m_titleLabel->setFrame(base::Rect::make(kPadding, kPadding, room, titleHeight));
    const bool inARow = buttonsStandInARow(size.width);
    const double rows = inARow ? 1 : static_cast<double>(m_buttons.size());
    double y = size.height - rows * kButtonHeight;
    const double messageTop = kPadding + titleHeight + kSpacing;
    m_messageLabel->setFrame(
        base::Rect::make(kPadding, messageTop, room,
                         std::max(0.0, std::min(m_messageLabel->heightThatFits(room), y - kPadding - messageTop))));
    for (std::size_t i = 0; i < m_buttons.size(); ++i) {
        if (inARow) {
            // The first stands where rows begin.
            const bool right = (i == 0) == (itsWindow && itsWindow->isRightToLeft());
            const double half = size.width / 2;
            m_buttons[i]->setFrame(base::Rect::make(right ? half : 0, y, half, kButtonHeight));
            m_separators[i]->setFrame(i == 0 ? base::Rect::make(0, y, size.width, hairline)
                                             : base::Rect::make(half, y, hairline, kButtonHeight));
        } else {
            m_buttons[i]->setFrame(base::Rect::make(0, y, size.width, kButtonHeight));
            m_separators[i]->setFrame(base::Rect::make(0, y, size.width, hairline));
            y += kButtonHeight;
        }
    }
}

std::optional<std::size_t> AlertController::indexOf(AlertAction::Style style) const
{
    const auto found = std::find_if(m_actions.begin(), m_actions.end(),
                                    [&](const AlertAction& action) { return action.style == style; });
    return found == m_actions.end() ? std::nullopt : std::optional(static_cast<std::size_t>(found - m_actions.begin()));
}

std::vector<KeyCommand> AlertController::keyCommands() const
{
    assertHere();
    return {{Key::Return, 0, false, confirmSelector()}};
}

void AlertController::confirm()
{
    assertHere();
    if (const auto index = indexOf(AlertAction::Style::Default))
        pick(*index);
    else if (m_actions.size() == 1)
        pick(0);
}

bool AlertController::presentationShouldClose()
{
    assertHere();
    if (const auto index = indexOf(AlertAction::Style::Cancel))
        pick(*index);
    else if (m_actions.size() == 1)
        pick(0);
    return m_actions.empty();
}

std::shared_ptr<View> AlertController::preferredFocusView()
{
    assertHere();
    const auto index = indexOf(AlertAction::Style::Default);
    const auto harmless = index ? index : indexOf(AlertAction::Style::Cancel);
    return harmless && *harmless < m_buttons.size() ? m_buttons[*harmless] : nullptr;
}

void AlertController::buttonPressed(std::shared_ptr<runtime::Object> button)
{
    assertHere();
    for (std::size_t i = 0; i < m_buttons.size(); ++i)
        if (m_buttons[i] == button)
            pick(i);
}

void AlertController::pick(std::size_t index)
{
    assertHere();
    if (index >= m_actions.size() || std::exchange(m_picked, true))
        return;
    dismiss(true, m_actions[index].handler);
}

} // namespace platform
