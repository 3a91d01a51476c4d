#include "platform/views/BarButtonItem.h"

#include <utility>

namespace platform {

namespace {

const runtime::Selector& triggerSelector()
{
    static const runtime::Selector selector("trigger");
    return selector;
}

/// What the standard items look like, and how they are called.
struct Looks {
    const char* glyph;
    const char* nameKey;
    bool emphasized = false;
};

Looks looksOf(BarButtonItem::Kind kind)
{
    using Kind = BarButtonItem::Kind;
    switch (kind) {
    case Kind::Action:
        return {"share", "BAR_SHARE"};
    case Kind::Play:
        return {"play", "BAR_PLAY"};
    case Kind::Pause:
        return {"pause", "BAR_PAUSE"};
    case Kind::Undo:
        return {"", "BAR_UNDO"};
    case Kind::Done:
        return {"", "BAR_DONE", true};
    case Kind::Save:
        return {"", "BAR_SAVE", true};
    case Kind::Cancel:
        return {"", "BAR_CANCEL"};
    case Kind::FlexibleSpace:
    case Kind::FixedSpace:
    case Kind::Custom:
        break;
    }
    return {"", ""};
}

} // namespace

BarButtonItem::BarButtonItem(const MessageCatalog& words, Kind kind, std::weak_ptr<runtime::Object> target,
                             runtime::Selector action)
    : m_words(&words), m_kind(kind), m_targetAction(std::move(target), std::move(action))
{
}

const runtime::Class& BarButtonItem::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<BarButtonItem>("BarButtonItem", &runtime::Object::classObject())
            .method(triggerSelector().name(), &BarButtonItem::trigger)
            .build();
    return instance;
}

const runtime::Class& BarButtonItem::isa() const
{
    return classObject();
}

std::shared_ptr<BarButtonItem> BarButtonItem::flexibleSpace()
{
    return std::shared_ptr<BarButtonItem>(new BarButtonItem(Kind::FlexibleSpace));
}

std::shared_ptr<BarButtonItem> BarButtonItem::fixedSpace(double width)
{
    std::shared_ptr<BarButtonItem> space(new BarButtonItem(Kind::FixedSpace));
    space->setWidth(width);
    return space;
}

std::shared_ptr<BarButtonItem> BarButtonItem::withCustomView(std::shared_ptr<View> view)
{
    std::shared_ptr<BarButtonItem> item(new BarButtonItem(Kind::Custom));
    item->m_view = std::move(view);
    return item;
}

void BarButtonItem::setWidth(double width)
{
    assertHere();
    if (m_width == width)
        return;
    m_width = width;
    if (const auto bar = m_view ? m_view->superview() : nullptr)
        bar->setNeedsLayout();
}

void BarButtonItem::setImageInsets(base::EdgeInsets insets)
{
    assertHere();
    m_imageInsets = insets;
    if (const auto itsButton = button())
        itsButton->setImageInsets(insets);
}

std::shared_ptr<View> BarButtonItem::view()
{
    assertHere();
    if (m_view || isSpace() || m_kind == Kind::Custom)
        return m_view;
    const Looks looks = looksOf(m_kind);
    const auto made = std::make_shared<Button>();
    if (*looks.glyph) {
        made->setGlyph(looks.glyph);
        made->setAccessibilityLabel(m_words->text(looks.nameKey));
    } else {
        made->setTitle(m_words->text(looks.nameKey));
    }
    made->setEmphasized(looks.emphasized);
    made->setImageInsets(m_imageInsets);
    made->addTarget(weakSelf<runtime::Object>(), triggerSelector(), kTouchUpInside);
    withoutAnimation([&] { made->sizeToFit(); });
    m_view = made;
    validate();
    return m_view;
}

void BarButtonItem::validate()
{
    assertHere();
    if (const auto itsButton = button())
        itsButton->setEnabled(m_targetAction.isAnswered());
}

void BarButtonItem::trigger()
{
    assertHere();
    m_targetAction.send(self<runtime::Object>());
}

std::shared_ptr<Button> BarButtonItem::button() const
{
    return m_kind == Kind::Custom ? nullptr : std::dynamic_pointer_cast<Button>(m_view);
}

} // namespace platform
