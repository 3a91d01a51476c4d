#include "linux/ffmpeg/exporting/output/IndexRoom.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <span>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace ffmpeg {

namespace {

using Bytes = std::span<std::uint8_t>;

constexpr std::size_t kHeader = 8;       ///< of a box: its size and its type
constexpr std::size_t kLargeHeader = 16; ///< of one whose size has eight bytes
constexpr std::int64_t kLittle = 50;     ///< less than one part of so many of the file is left where it is
constexpr std::size_t kStep = 4 << 20;

struct Box {
    std::int64_t position = 0;
    std::int64_t size = 0;
    std::array<char, 4> type{};
    bool is(const char* name) const { return std::string_view(type.data(), type.size()) == name; }
};

std::uint64_t numberAt(const std::uint8_t* bytes, std::size_t count)
{
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < count; ++i)
        value = value << 8 | bytes[i];
    return value;
}

void setNumber(std::uint8_t* bytes, std::size_t count, std::uint64_t value)
{
    for (std::size_t i = count; i-- > 0; value >>= 8)
        bytes[i] = static_cast<std::uint8_t>(value);
}

bool readAt(const OutputFile& file, std::int64_t position, Bytes into)
{
    while (!into.empty()) {
        const ssize_t got = pread(file.descriptor(), into.data(), into.size(), position);
        if (got <= 0)
            return false;
        position += got;
        into = into.subspan(static_cast<std::size_t>(got));
    }
    return true;
}

/// The boxes of a file, one behind the other up to its end. Empty when they do not end there.
std::vector<Box> boxesOf(const OutputFile& file, std::int64_t end)
{
    std::vector<Box> boxes;
    for (std::int64_t at = 0; at < end;) {
        std::array<std::uint8_t, kLargeHeader> header{};
        const auto size = static_cast<std::size_t>(std::min<std::int64_t>(kLargeHeader, end - at));
        if (size < kHeader || !readAt(file, at, Bytes(header).first(size)))
            return {};
        Box box{at, static_cast<std::int64_t>(numberAt(header.data(), 4)), {}};
        std::memcpy(box.type.data(), &header[4], box.type.size());
        if (box.size == 1 && size == kLargeHeader)
            box.size = static_cast<std::int64_t>(numberAt(&header[kHeader], 8));
        if (box.size < static_cast<std::int64_t>(kHeader) || box.size > end - at)
            return {};
        boxes.push_back(box);
        at += box.size;
    }
    return boxes;
}

/// In a box, and those in it: the places of chunks in the file become so much smaller.
void moveChunks(Bytes box, std::uint64_t by)
{
    constexpr std::array<std::string_view, 5> kParents{"moov", "trak", "mdia", "minf", "stbl"};
    constexpr std::size_t kTable = kHeader + 8; // behind version, flags and the number of entries
    const std::string_view type(reinterpret_cast<const char*>(&box[4]), 4);
    const std::size_t width = type == "stco" ? 4 : type == "co64" ? 8 : 0;
    if (width > 0 && box.size() >= kTable) {
        const std::uint64_t count = std::min(numberAt(&box[kTable - 4], 4), (box.size() - kTable) / width);
        for (std::uint64_t i = 0; i < count; ++i) {
            std::uint8_t* place = &box[kTable + i * width];
            setNumber(place, width, numberAt(place, width) - by);
        }
    }
    if (std::find(kParents.begin(), kParents.end(), type) == kParents.end())
        return;
    for (Bytes rest = box.subspan(kHeader); rest.size() >= kHeader;) {
        const std::uint64_t size = numberAt(rest.data(), 4);
        if (size < kHeader || size > rest.size())
            return;
        moveChunks(rest.first(size), by);
        rest = rest.subspan(size);
    }
}

/// All from `from` on moves forward to `to`.
int moveData(OutputFile& file, std::int64_t from, std::int64_t to, std::int64_t end)
{
    std::vector<std::uint8_t> bytes(kStep);
    while (from < end) {
        const auto count = static_cast<std::size_t>(std::min<std::int64_t>(kStep, end - from));
        if (!readAt(file, from, Bytes(bytes).first(count)))
            return -EIO;
        if (const int error = file.write(to, bytes.data(), count); error != 0)
            return error;
        from += static_cast<std::int64_t>(count);
        to += static_cast<std::int64_t>(count);
    }
    return ftruncate(file.descriptor(), to) == 0 ? 0 : -errno;
}

} // namespace

int closeIndexRoom(OutputFile& file)
{
    struct stat about {};
    if (fstat(file.descriptor(), &about) != 0)
        return -errno;
    const std::vector<Box> boxes = boxesOf(file, about.st_size);
    const auto find = [&](const char* type) {
        return std::find_if(boxes.begin(), boxes.end(), [&](const Box& box) { return box.is(type); });
    };
    const auto index = find("moov");
    const auto data = find("mdat");
    if (index == boxes.end() || data == boxes.end() || index > data
        || !std::all_of(index + 1, data, [](const Box& box) { return box.is("free"); }))
        return 0;
    const std::int64_t indexEnd = index->position + index->size;
    const std::int64_t room = data->position - indexEnd;
    if (room <= 0 || room * kLittle < about.st_size)
        return 0;
    std::vector<std::uint8_t> moov(static_cast<std::size_t>(index->size));
    if (!readAt(file, index->position, moov))
        return -EIO;
    moveChunks(moov, static_cast<std::uint64_t>(room));
    if (const int error = file.write(index->position, moov.data(), moov.size()); error != 0)
        return error;
    return moveData(file, data->position, indexEnd, about.st_size);
}

} // namespace ffmpeg
