#include "linux/icu/StringFolding.h"

#include <unicode/normalizer2.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>
#include <unicode/utf8.h>

#include <cstdint>

namespace intl {

namespace {

/// Bytes that are not UTF-8 become lone surrogates, a different one for each: file names need not be text.
icu::UnicodeString decoded(std::string_view text)
{
    constexpr UChar32 kLoneSurrogates = 0xDC00;
    icu::UnicodeString result;
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    const auto size = static_cast<std::int32_t>(text.size());
    for (std::int32_t next = 0; next < size;) {
        std::int32_t end = next;
        UChar32 character = 0;
        U8_NEXT(bytes, end, size, character);
        if (character < 0) {
            character = kLoneSurrogates + bytes[next];
            end = next + 1;
        }
        result.append(character);
        next = end;
    }
    return result;
}

icu::UnicodeString withoutMarks(const icu::UnicodeString& text, const icu::Normalizer2& decomposition)
{
    UErrorCode status = U_ZERO_ERROR;
    const icu::UnicodeString whole = decomposition.normalize(text, status);
    icu::UnicodeString bare;
    for (std::int32_t i = 0; i < whole.length(); i = whole.moveIndex32(i, 1)) {
        const UChar32 character = whole.char32At(i);
        if ((U_GET_GC_MASK(character) & (U_GC_MN_MASK | U_GC_ME_MASK)) == 0)
            bare.append(character);
    }
    return bare;
}

/// Folding the case can bring out marks that were part of a letter, so they are dropped before and after.
icu::UnicodeString folded(std::string_view text, const icu::Normalizer2& decomposition)
{
    icu::UnicodeString bare = withoutMarks(decoded(text), decomposition);
    return withoutMarks(bare.foldCase(U_FOLD_CASE_DEFAULT), decomposition);
}

} // namespace

bool StringFolding::hasPrefix(std::string_view text, std::string_view prefix) const
{
    UErrorCode status = U_ZERO_ERROR;
    const icu::Normalizer2* decomposition = icu::Normalizer2::getNFDInstance(status);
    if (U_FAILURE(status))
        return text.starts_with(prefix); // ICU has no data at all
    return static_cast<bool>(folded(text, *decomposition).startsWith(folded(prefix, *decomposition)));
}

} // namespace intl
