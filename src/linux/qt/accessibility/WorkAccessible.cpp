#include "linux/qt/accessibility/WorkAccessible.h"

#include "linux/qt/accessibility/ItemAccessible.h"
#include "linux/qt/items/WorkLine.h"

#include <QAccessible>
#include <QAccessibleValueInterface>

namespace qtui {

namespace {

class WorkAccessible final : public ItemAccessible, public QAccessibleValueInterface {
public:
    explicit WorkAccessible(WorkLine& line) : ItemAccessible(line), m_line(line) {}

    QString text(QAccessible::Text kind) const override
    {
        if (kind == QAccessible::Name)
            return m_line.name();
        return kind == QAccessible::Value ? m_line.percentText() : QString();
    }
    QAccessible::Role role() const override { return QAccessible::ProgressBar; }
    QAccessible::State state() const override
    {
        QAccessible::State state;
        state.busy = m_line.isUnderWay();
        state.invisible = !m_line.isUnderWay();
        state.readOnly = true;
        return state;
    }
    void* interface_cast(QAccessible::InterfaceType type) override
    {
        return type == QAccessible::ValueInterface ? static_cast<QAccessibleValueInterface*>(this) : nullptr;
    }

    QVariant currentValue() const override { return m_line.percent().value_or(0); }
    void setCurrentValue(const QVariant& /*value*/) override {}
    QVariant maximumValue() const override { return 100; }
    QVariant minimumValue() const override { return 0; }
    QVariant minimumStepSize() const override { return 1; }

private:
    WorkLine& m_line;
};

void tell(WorkLine& line, QAccessible::Event kind)
{
    if (!QAccessible::isActive())
        return;
    QAccessibleEvent event(&line, kind);
    QAccessible::updateAccessibility(&event);
}

} // namespace

QAccessibleInterface* makeWorkAccessible(WorkLine& line)
{
    return new WorkAccessible(line);
}

void announceWorkBegun(WorkLine& line)
{
    tell(line, QAccessible::ObjectShow);
    tell(line, QAccessible::Alert);
}

void announceWorkProgress(WorkLine& line)
{
    if (!QAccessible::isActive())
        return;
    QAccessibleValueChangeEvent event(&line, line.percent().value_or(0));
    QAccessible::updateAccessibility(&event);
}

void announceWorkEnded(WorkLine& line)
{
    tell(line, QAccessible::ObjectHide);
}

} // namespace qtui
