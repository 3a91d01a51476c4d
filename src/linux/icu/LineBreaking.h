/// Breaking text into lines where its language allows it, by ICU. Any thread.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace intl {

/// The lines of `text`, none wider than `columns` but for what cannot be broken. Letters as wide as high (Han, kana, Hangul)
/// take two columns, marks on letters none. Where the text has ends of lines, its lines end, too; spaces at ends are dropped.
std::vector<std::string> brokenIntoLines(std::string_view text, int columns);

} // namespace intl
