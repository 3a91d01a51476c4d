/// A localisation table, as `*.strings` files hold it: `"key" = "text";` in UTF-8, comments as in C. Any thread.
///
/// Within quotes `\"`, `\\`, `\n`, `\r` and `\t` stand for what they stand for in C, and `\U201C` for the character of that
/// number. Words of letters, digits and `_.-` need no quotes. Of a key that comes twice the later text counts.
#pragma once

#include "base/Error.h"

#include <functional>
#include <map>
#include <string>
#include <string_view>

namespace platform {

using StringsTable = std::map<std::string, std::string, std::less<>>;

struct ParsedStrings {
    StringsTable table;   ///< what was understood: all up to the error
    base::ErrorRef error; ///< says in which line; null when all of it was understood
};

/// `name` is what errors call the table. The code of an error is EILSEQ (what is not UTF-8) or EINVAL.
ParsedStrings parseStrings(std::string_view text, const std::string& name);

} // namespace platform
