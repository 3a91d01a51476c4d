#include "platform/views/ListRow.h"

namespace platform {

const runtime::Class& ListRow::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<ListRow>("ListRow", &Button::classObject()).build();
    return instance;
}

const runtime::Class& ListRow::isa() const
{
    return classObject();
}

void ListRow::setTrailingInset(double inset)
{
    assertHere();
    if (m_trailingInset == inset)
        return;
    m_trailingInset = inset;
    setNeedsDisplay();
}

void ListRow::setBusy(bool busy)
{
    assertHere();
    if (m_busy == busy)
        return;
    m_busy = busy;
    setNeedsDisplay();
}

} // namespace platform
