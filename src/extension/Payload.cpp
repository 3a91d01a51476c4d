#include "extension/Payload.h"

PayloadValues Payload::values() const
{
    const std::lock_guard lock(m_mutex);
    return m_values;
}

void Payload::setValues(PayloadValues values)
{
    const std::lock_guard lock(m_mutex);
    m_values = std::move(values);
}
