/// The words that people read and hear, in their language: every text of a window comes from here. Any thread.
///
/// Keys are of the program's own tables. A message can have places for names and numbers, `{name}`, and forms for numbers,
/// as ICU's message patterns have them: `{count, plural, one {# movie} other {# movies}}`.
#pragma once

#include "base/Error.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace platform {

/// What stands in a message's place: a text as it is, or a number as the user writes it.
struct MessageArgument {
    const char* name;
    std::variant<std::string, std::int64_t, double> value;
};

class MessageCatalog {
public:
    virtual ~MessageCatalog() = default;

    /// In English where the user's language has none, and the key itself where that has none either.
    virtual std::string text(std::string_view key) const = 0;
    /// The same with its places filled; a place that is not named here stays as it is.
    virtual std::string text(std::string_view key, const std::vector<MessageArgument>& arguments) const = 0;
    /// How long something is: "1 minute, 5.25 seconds" with two decimals, cut off, as what is not reached yet is not said.
    /// What is no such time is 0 seconds.
    virtual std::string duration(double seconds, int decimals) const = 0;
    /// The same as clocks show it, in whole seconds, cut off: "0:42", "1:02:03".
    virtual std::string clock(double seconds) const = 0;
    /// How large a file is, a thousand bytes to the kilobyte: "12.4 MB".
    virtual std::string fileSize(std::int64_t bytes) const = 0;
    /// Several names as one text: "a, b, and c".
    virtual std::string list(const std::vector<std::string>& names) const = 0;
    /// Whether the words run from right to left.
    virtual bool isRightToLeft() const = 0;
};

/// What a person reads of an error: its message in their language, else its description.
std::string wordsFor(const base::Error& error, const MessageCatalog& words);

} // namespace platform
