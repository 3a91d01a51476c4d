/// Says something that the user has to know or to decide, and what can be done about it. Main queue only.
///
/// Return does what the default action does (or the only one), Esc what the cancel action does. Picking one takes the alert
/// away, and what the action stands for is done when it has gone.
#pragma once

#include "platform/views/Button.h"
#include "platform/views/Label.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace platform {

struct AlertAction {
    enum class Style { Default, Cancel, Destructive };

    std::string title;
    Style style = Style::Default;
    std::function<void()> handler = {}; ///< may be empty
};

class AlertController final : public ViewController {
public:
    AlertController(std::string title, std::string message);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// In the order of the story; before it is presented.
    void addAction(AlertAction action);
    const std::vector<AlertAction>& actions() const { return here(m_actions); }
    const std::string& message() const { return here(m_message); }
    /// What a tap on the action of that place does.
    void pick(std::size_t index);

    void viewDidLoad() override;
    void viewDidLayoutSubviews() override;
    base::Size contentSizeThatFits(base::Size room) override;
    bool presentationShouldClose() override;
    std::shared_ptr<View> preferredFocusView() override;
    bool canBecomeFirstResponder() const override { return true; }
    std::vector<KeyCommand> keyCommands() const override;

    // Answers its buttons and keys.
    void buttonPressed(std::shared_ptr<runtime::Object> button);
    void confirm();

private:
    std::optional<std::size_t> indexOf(AlertAction::Style style) const;
    bool buttonsStandInARow(double width) const;
    double textHeight(double width) const;

    std::string m_message;
    std::vector<AlertAction> m_actions;
    bool m_picked = false;
    std::shared_ptr<Label> m_titleLabel;
    std::shared_ptr<Label> m_messageLabel;
    std::vector<std::shared_ptr<Button>> m_buttons;
    std::vector<std::shared_ptr<View>> m_separators; ///< one above each button, and one between two in a row
};

} // namespace platform
