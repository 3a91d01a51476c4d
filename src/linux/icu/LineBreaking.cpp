#include "linux/icu/LineBreaking.h"

#include <unicode/brkiter.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>

#include <memory>

namespace intl {

namespace {

int columnsOf(UChar32 character)
{
    const auto category = u_charType(character);
    if (category == U_NON_SPACING_MARK || category == U_ENCLOSING_MARK || category == U_FORMAT_CHAR)
        return 0;
    const int width = u_getIntPropertyValue(character, UCHAR_EAST_ASIAN_WIDTH);
    return width == U_EA_WIDE || width == U_EA_FULLWIDTH ? 2 : 1;
}

int columnsOf(const icu::UnicodeString& text)
{
    int columns = 0;
    for (std::int32_t at = 0; at < text.length(); at = text.moveIndex32(at, 1))
        columns += columnsOf(text.char32At(at));
    return columns;
}

std::string trimmed(icu::UnicodeString text)
{
    std::string result;
    return text.trim().toUTF8String(result);
}

} // namespace

std::vector<std::string> brokenIntoLines(std::string_view text, int columns)
{
    const auto whole =
        icu::UnicodeString::fromUTF8(icu::StringPiece(text.data(), static_cast<std::int32_t>(text.size())));
    UErrorCode status = U_ZERO_ERROR;
    const std::unique_ptr<icu::BreakIterator> breaks(
        icu::BreakIterator::createLineInstance(icu::Locale::getRoot(), status));
    if (U_FAILURE(status))
        return {std::string(text)};
    breaks->setText(whole);

    std::vector<std::string> lines;
    icu::UnicodeString line;
    std::int32_t begin = breaks->first();
    for (std::int32_t end = breaks->next(); end != icu::BreakIterator::DONE; begin = end, end = breaks->next()) {
        const icu::UnicodeString piece(whole, begin, end - begin);
        icu::UnicodeString visible(piece); // the space behind a word may stand outside
        visible.trim();
        if (!line.isEmpty() && columnsOf(line) + columnsOf(visible) > columns) {
            lines.push_back(trimmed(line));
            line.remove();
        }
        line += piece;
        if (breaks->getRuleStatus() >= UBRK_LINE_HARD) {
            lines.push_back(trimmed(line));
            line.remove();
        }
    }
    if (!line.isEmpty())
        lines.push_back(trimmed(line));
    return lines;
}

} // namespace intl
