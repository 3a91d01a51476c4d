/// What the window shows when there is no movie to show: a few words in its middle, and a way out. Main queue only.
#pragma once

#include "platform/views/Label.h"
#include "platform/views/Toolbar.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace app {

class NoticeScreen final : public platform::ViewController {
public:
    struct Handlers {
        std::function<void()> closed;            ///< the user wants to leave
        std::function<void(base::Rect)> resized; ///< the view's bounds, whenever they were laid out; may be empty
    };

    /// Shows `text`; `words`, which outlive it, are those of its button.
    NoticeScreen(const platform::MessageCatalog& words, std::string text, bool hasHomeButton, Handlers handlers);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override { return classObject(); }

    void loadView() override;
    void viewWillAppear(bool animated) override;
    void viewDidLayoutSubviews() override;
    bool canBecomeFirstResponder() const override { return true; }
    std::vector<platform::KeyCommand> keyCommands() const override;

    void close();

private:
    const platform::MessageCatalog& m_words;
    const std::string m_text;
    const double m_barHeight;
    Handlers m_handlers;
    std::shared_ptr<platform::Toolbar> m_bar;
    std::vector<std::shared_ptr<platform::Label>> m_lines;
};

} // namespace app
