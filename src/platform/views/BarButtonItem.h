/// One place in a toolbar: a standard item, a space, or a view of one's own. Main queue only.
#pragma once

#include "base/Geometry.h"
#include "platform/files/MessageCatalog.h"
#include "platform/views/Button.h"

#include <memory>

namespace platform {

class BarButtonItem final : public runtime::Object {
public:
    enum class Kind { Action, Undo, Pause, Play, Done, Save, Cancel, FlexibleSpace, FixedSpace, Custom };

    /// A standard item; `words`, which outlive it, have its name.
    BarButtonItem(const MessageCatalog& words, Kind kind, std::weak_ptr<runtime::Object> target,
                  runtime::Selector action);
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// A space; `width` counts for the fixed kind.
    static std::shared_ptr<BarButtonItem> flexibleSpace();
    static std::shared_ptr<BarButtonItem> fixedSpace(double width);
    static std::shared_ptr<BarButtonItem> withCustomView(std::shared_ptr<View> view);

    Kind kind() const { return here(m_kind); }
    const runtime::TargetAction& targetAction() const { return here(m_targetAction); }
    bool isSpace() const { return here(m_kind) == Kind::FlexibleSpace || m_kind == Kind::FixedSpace; }

    /// Points; 0 means: as wide as its content.
    double width() const { return here(m_width); }
    void setWidth(double width);
    base::EdgeInsets imageInsets() const { return here(m_imageInsets); }
    void setImageInsets(base::EdgeInsets insets);

    /// What stands in the toolbar: the custom view, or a button made once. Null for spaces.
    /// A button whose target does not answer its action is disabled.
    std::shared_ptr<View> view();

    /// Enables or disables the button, as its target answers the action now or not. A view of one's own stays as it is.
    void validate();

    /// What a tap does.
    void trigger();

private:
    explicit BarButtonItem(Kind kind) : m_kind(kind) {}

    std::shared_ptr<Button> button() const;

    const MessageCatalog* m_words = nullptr; ///< of standard items
    Kind m_kind;
    runtime::TargetAction m_targetAction;
    double m_width = 0;
    base::EdgeInsets m_imageInsets;
    std::shared_ptr<View> m_view;
};

} // namespace platform
