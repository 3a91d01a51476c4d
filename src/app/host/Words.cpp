#include "app/host/Words.h"

#include "app/host/RequestText.h"

#include <charconv>
#include <system_error>

namespace host {

base::ErrorRef usageError(const std::string& text)
{
    return base::Error::make("org.clipsa.usage", 2, text + " (see clipsa --help)");
}

std::optional<std::int32_t> wholeNumber(const std::string& text)
{
    std::int32_t number = 0;
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || rest != end || number < 0)
        return std::nullopt;
    return number;
}

bool Words::advance()
{
    m_affinity.assertHere();
    m_value.reset();
    if (m_next >= m_words.size())
        return false;
    m_word = m_words[m_next++];
    if (!m_onlyPlain && m_word == "--") {
        m_onlyPlain = true;
        return advance();
    }
    m_isOption = !m_onlyPlain && m_word.size() > 1 && m_word.front() == '-';
    const std::size_t equals = m_word.find('=');
    if (m_isOption && equals != std::string::npos) {
        m_value = m_word.substr(equals + 1);
        m_word.resize(equals);
    }
    return true;
}

base::Result<std::string> Words::value()
{
    m_affinity.assertHere();
    if (!m_value && m_next < m_words.size())
        m_value = m_words[m_next++];
    if (!m_value)
        return usageError(m_word + " needs a value");
    if (const auto checked = checkText(*m_value, "the value of " + m_word); !checked)
        return checked.error();
    return *m_value;
}

} // namespace host
