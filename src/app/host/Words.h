/// The words of a command line, one by one. One thread.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace host {

/// An error of the command line: `text`, and where to look.
base::ErrorRef usageError(const std::string& text);

/// From 0 up, without anything around it.
std::optional<std::int32_t> wholeNumber(const std::string& text);

/// `--name=value` is the same as `--name value`, and nothing after `--` is an option.
class Words {
public:
    /// From the word `first` on; `words` outlive this.
    explicit Words(const std::vector<std::string>& words, std::size_t first) : m_words(words), m_next(first) {}

    /// To the next word. False at the end.
    bool advance();

    bool isOption() const
    {
        m_affinity.assertHere();
        return m_isOption;
    }
    /// Without the value that it brought along.
    const std::string& word() const
    {
        m_affinity.assertHere();
        return m_word;
    }
    bool hasOwnValue() const
    {
        m_affinity.assertHere();
        return m_value.has_value();
    }
    /// Whether it asks for help.
    bool isHelp() const
    {
        m_affinity.assertHere();
        return m_isOption && (m_word == "--help" || m_word == "-h");
    }

    /// The option's value, a word behind it perhaps.
    base::Result<std::string> value();

private:
    base::Affinity m_affinity;
    const std::vector<std::string>& m_words;
    std::size_t m_next;
    bool m_onlyPlain = false;
    bool m_isOption = false;
    std::string m_word;
    std::optional<std::string> m_value;
};

} // namespace host
