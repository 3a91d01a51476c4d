#include "linux/ffmpeg/FileMarks.h"

#include <algorithm>
#include <array>
#include <bit>
#include <functional>
#include <iterator>
#include <string_view>
#include <vector>

namespace ffmpeg {

namespace {

using namespace std::string_view_literals;

constexpr std::size_t kHead = 4096;
/// A fragmented file has thousands of boxes, and an index of none of them to miss.
constexpr int kMostBoxes = 64;
constexpr int kMostParts = 4096; ///< of AVI, of a gigabyte each
constexpr std::int64_t kLargest = std::int64_t(1) << 56;

/// The first bytes of the file.
class Head {
public:
    explicit Head(const OpenFile& file) : m_bytes(kHead)
    {
        const std::int64_t got = file.read(0, m_bytes.data(), m_bytes.size());
        m_bytes.resize(static_cast<std::size_t>(std::max<std::int64_t>(got, 0)));
    }

    bool has(std::string_view text, std::size_t at) const
    {
        return at <= m_bytes.size() && this->text().substr(at).starts_with(text);
    }
    std::optional<std::size_t> find(std::string_view text) const
    {
        const auto at = this->text().find(text);
        return at == std::string_view::npos ? std::nullopt : std::optional(at);
    }
    std::uint8_t byte(std::size_t at) const { return at < m_bytes.size() ? m_bytes[at] : 0; }
    std::uint64_t bigEndian(std::size_t at, std::size_t count) const
    {
        std::uint64_t number = 0;
        for (std::size_t i = 0; i < count; ++i)
            number = number << 8 | byte(at + i);
        return number;
    }
    std::uint64_t littleEndian(std::size_t at, std::size_t count) const
    {
        std::uint64_t number = 0;
        for (std::size_t i = count; i-- > 0;)
            number = number << 8 | byte(at + i);
        return number;
    }

private:
    std::string_view text() const { return {reinterpret_cast<const char*>(m_bytes.data()), m_bytes.size()}; }

    std::vector<std::uint8_t> m_bytes;
};

std::optional<std::int64_t> plausible(std::uint64_t size)
{
    return size > 0 && size < std::uint64_t(kLargest) ? std::optional(static_cast<std::int64_t>(size)) : std::nullopt;
}

/// A size of Matroska (RFC 8794, 4): as many zero bits in front as bytes follow; all ones is unknown. Moves `at` behind.
std::optional<std::int64_t> sizeOfElement(const Head& head, std::size_t& at)
{
    const auto extra = static_cast<std::size_t>(std::countl_zero(head.byte(at)));
    if (extra > 7)
        return std::nullopt;
    const std::uint64_t mask = (std::uint64_t(1) << (7 * (extra + 1))) - 1;
    const std::uint64_t size = head.bigEndian(at, extra + 1) & mask;
    at += extra + 1;
    return size == mask || size >= std::uint64_t(kLargest) ? std::nullopt
                                                           : std::optional(static_cast<std::int64_t>(size));
}

std::optional<std::int64_t> sizeOfMatroska(const Head& head)
{
    std::size_t at = 4;
    const auto header = sizeOfElement(head, at);
    if (!header || *header > static_cast<std::int64_t>(kHead))
        return std::nullopt;
    at += static_cast<std::size_t>(*header);
    if (!head.has("\x18\x53\x80\x67"sv, at)) // the segment, which holds all else
        return std::nullopt;
    at += 4;
    const auto segment = sizeOfElement(head, at);
    return segment ? std::optional(static_cast<std::int64_t>(at) + *segment) : std::nullopt;
}

/// Of AVI, and of all its parts where it has several because one would be too long (OpenDML).
std::optional<std::int64_t> sizeOfRiff(const OpenFile& file)
{
    const std::int64_t size = file.size();
    std::optional<std::int64_t> end;
    std::int64_t at = 0;
    for (int parts = 0; parts < kMostParts && at < size; ++parts) {
        std::array<std::uint8_t, 8> header{};
        if (file.read(at, header.data(), header.size()) < std::ssize(header)
            || !std::equal(header.begin(), header.begin() + 4, "RIFF"))
            break;
        std::uint32_t length = 0;
        for (std::size_t i = header.size(); i-- > 4;)
            length = length << 8 | header.at(i);
        if (length == 0 || length == 0xFFFFFFFF)
            break;
        at += std::int64_t{8} + length;
        end = at;
        at += length % 2;
    }
    return end;
}

/// The property of the whole file (ASF, 3.2): an id of its own, then the size, which does not count where it was sent as
/// it was made.
std::optional<std::int64_t> sizeOfAsf(const Head& head)
{
    const auto at = head.find("\xA1\xDC\xAB\x8C\x47\xA9\xCF\x11\x8E\xE4\x00\xC0\x0C\x20\x53\x65"sv);
    if (!at || head.littleEndian(*at + 88, 4) & 1)
        return std::nullopt;
    return plausible(head.littleEndian(*at + 40, 8));
}

/// FLV has none of its own, but most writers tell in the metadata.
std::optional<std::int64_t> sizeOfFlv(const Head& head)
{
    constexpr auto kName = "filesize\0"sv; // and the type, a number
    const auto at = head.find(kName);
    if (!at)
        return std::nullopt;
    const double size = std::bit_cast<double>(head.bigEndian(*at + kName.size(), 8));
    return size > 0 && size < double(kLargest) ? std::optional(static_cast<std::int64_t>(size)) : std::nullopt;
}

bool isMp4(const Head& head)
{
    constexpr std::array kFirst = {"ftyp"sv, "moov"sv, "mdat"sv, "free"sv, "skip"sv, "wide"sv, "pnot"sv};
    return std::any_of(kFirst.begin(), kFirst.end(), [&](std::string_view each) { return head.has(each, 4); });
}

/// What a movie consists of: ISO 14496-12 and QuickTime.
constexpr std::array kBoxes = {"ftyp"sv, "styp"sv, "moov"sv, "mdat"sv, "moof"sv, "mfra"sv,
                               "free"sv, "skip"sv, "wide"sv, "uuid"sv, "meta"sv, "udta"sv,
                               "sidx"sv, "ssix"sv, "prft"sv, "emsg"sv, "pdin"sv, "pnot"sv};

/// Tells the name and the end of each box of an MP4 file, until `take` wants no more.
void walkBoxes(const OpenFile& file, const std::function<bool(std::string_view, std::int64_t)>& take)
{
    const std::int64_t size = file.size();
    std::int64_t at = 0;
    for (int boxes = 0; boxes < kMostBoxes && at < size; ++boxes) {
        std::array<std::uint8_t, 16> header{};
        if (file.read(at, header.data(), header.size()) < 8)
            return;
        const auto number = [&](std::size_t from, std::size_t count) {
            std::uint64_t value = 0;
            for (std::size_t i = from; i < from + count; ++i)
                value = value << 8 | header.at(i);
            return value;
        };
        std::uint64_t length = number(0, 4);
        if (length == 1)
            length = number(8, 8);
        else if (length == 0) // up to the end of the file, wherever that is
            length = static_cast<std::uint64_t>(size - at);
        if (length < 8 || length > static_cast<std::uint64_t>(kLargest))
            return;
        at += static_cast<std::int64_t>(length);
        if (!take({reinterpret_cast<const char*>(header.data()) + 4, 4}, at))
            return;
    }
}

} // namespace

std::optional<std::int64_t> announcedSize(const OpenFile& file)
{
    const Head head(file);
    if (head.has("\x1A\x45\xDF\xA3"sv, 0))
        return sizeOfMatroska(head);
    if (head.has("RIFF"sv, 0))
        return sizeOfRiff(file);
    if (head.has("\x30\x26\xB2\x75\x8E\x66\xCF\x11"sv, 0))
        return sizeOfAsf(head);
    if (head.has("FLV"sv, 0))
        return sizeOfFlv(head);
    if (!isMp4(head))
        return std::nullopt;
    std::optional<std::int64_t> end;
    walkBoxes(file, [&](std::string_view name, std::int64_t boxEnd) {
        // What some devices put behind a movie is no box, and its first letters no length.
        const bool isBox = std::find(kBoxes.begin(), kBoxes.end(), name) != kBoxes.end();
        if (isBox)
            end = boxEnd;
        return isBox;
    });
    return end;
}

bool lacksIndex(const OpenFile& file)
{
    if (!isMp4(Head(file)))
        return false;
    bool hasMedia = false;
    bool hasIndex = false;
    walkBoxes(file, [&](std::string_view name, std::int64_t) {
        hasMedia = hasMedia || name == "mdat";
        hasIndex = hasIndex || name == "moov";
        return true;
    });
    return hasMedia && !hasIndex;
}

} // namespace ffmpeg
