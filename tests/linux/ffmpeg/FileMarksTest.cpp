// What a few bytes of a file say of how long it was, where the file itself may lack the rest.
#include "linux/ffmpeg/FileMarks.h"
#include "support/PrivateDirectory.h"

#include <gtest/gtest.h>

#include <fstream>
#include <string>

namespace {

using namespace std::string_literals;

class FileMarks : public testing::Test {
protected:
    std::shared_ptr<ffmpeg::OpenFile> fileOf(const std::string& bytes) const
    {
        std::ofstream(path, std::ios::binary) << bytes;
        return std::move(ffmpeg::OpenFile::open(path)).value();
    }
    std::optional<std::int64_t> sizeSaidIn(const std::string& bytes) const
    {
        return ffmpeg::announcedSize(*fileOf(bytes));
    }

    static std::string box(const std::string& name, std::uint32_t size)
    {
        std::string header;
        for (int shift = 24; shift >= 0; shift -= 8)
            header += static_cast<char>(size >> shift);
        return header + name;
    }
    static std::string filledBox(const std::string& name, std::uint32_t size)
    {
        return box(name, size) + std::string(size - 8, 'x');
    }
    static std::string part(std::uint32_t size)
    {
        std::string header = "RIFF";
        for (int shift = 0; shift < 32; shift += 8)
            header += static_cast<char>(size >> shift);
        return header;
    }
    static std::string filledPart(std::uint32_t size) { return part(size) + std::string((size + 1) / 2 * 2, 'x'); }

    tests::PrivateDirectory directory;
    std::string path = directory.path() / "marks";
};

TEST_F(FileMarks, OfMp4AreItsBoxes)
{
    const std::string begin = filledBox("ftyp", 32) + filledBox("moov", 100);
    EXPECT_EQ(sizeSaidIn(begin + filledBox("mdat", 500)), 632);
    EXPECT_EQ(sizeSaidIn(begin + box("mdat", 500)), 632) << "cut off";
    EXPECT_EQ(sizeSaidIn(begin + box("mdat", 1) + "\0\0\0\1\0\0\0\0"s), 132 + (1LL << 32)) << "long";
    EXPECT_EQ(sizeSaidIn(begin + box("mdat", 0) + "more"), 144) << "to the end, wherever that is";
}

TEST_F(FileMarks, OfMp4AreNothingThatSomebodyPutBehindIt)
{
    const std::string movie = filledBox("ftyp", 32) + filledBox("moov", 100) + filledBox("mdat", 500);
    EXPECT_EQ(sizeSaidIn(movie + "AAAAjunk, which would be a box of a gigabyte"), 632);
    EXPECT_EQ(sizeSaidIn(movie + std::string(40, '\xff')), 632);
}

TEST_F(FileMarks, OfMp4TellWhetherItsIndexIsMissing)
{
    EXPECT_TRUE(ffmpeg::lacksIndex(*fileOf(filledBox("ftyp", 32) + box("mdat", 500))));
    EXPECT_FALSE(ffmpeg::lacksIndex(*fileOf(filledBox("ftyp", 32) + filledBox("mdat", 500) + box("moov", 100))));
    EXPECT_FALSE(ffmpeg::lacksIndex(*fileOf(filledBox("ftyp", 32))));
    EXPECT_FALSE(ffmpeg::lacksIndex(*fileOf("something else")));
}

TEST_F(FileMarks, OfAviAreAllItsParts)
{
    EXPECT_EQ(sizeSaidIn(filledPart(300)), 308);
    EXPECT_EQ(sizeSaidIn(filledPart(301) + filledPart(200)), 310 + 208);
    EXPECT_EQ(sizeSaidIn(filledPart(300) + part(200) + "AVIX"), 308 + 208) << "cut off in the second";
    EXPECT_EQ(sizeSaidIn(part(0) + "AVI "), std::nullopt) << "its recorder was stopped";
    EXPECT_EQ(sizeSaidIn(part(0xFFFFFFFF) + "AVI "), std::nullopt);
    EXPECT_EQ(sizeSaidIn(filledPart(300) + part(0)), 308);
}

TEST_F(FileMarks, OfAsfDoNotCountWhereItWasSentAsItWasMade)
{
    const auto asf = [](char flags) {
        std::string file = "\x30\x26\xB2\x75\x8E\x66\xCF\x11"s + std::string(22, '\0')
                           + "\xA1\xDC\xAB\x8C\x47\xA9\xCF\x11\x8E\xE4\x00\xC0\x0C\x20\x53\x65"s;
        file.resize(file.size() + 24, '\0');
        file += "\x00\x10\0\0\0\0\0\0"s;
        file.resize(file.size() + 40, '\0');
        return file + flags + "\0\0\0"s;
    };
    EXPECT_EQ(sizeSaidIn(asf(2)), 4096);
    EXPECT_EQ(sizeSaidIn(asf(3)), std::nullopt);
}

TEST_F(FileMarks, OfMatroskaAreTheLengthOfItsSegment)
{
    const std::string head = "\x1A\x45\xDF\xA3\x84"s + "1234" + "\x18\x53\x80\x67"s;
    EXPECT_EQ(sizeSaidIn(head + "\x42\x00"s), 15 + 512);
    EXPECT_EQ(sizeSaidIn(head + "\x01\xFF\xFF\xFF\xFF\xFF\xFF\xFF"s), std::nullopt) << "it was not known";
    EXPECT_EQ(sizeSaidIn(head), std::nullopt) << "it ends there";
}

TEST_F(FileMarks, OfFlvAreInItsMetadata)
{
    EXPECT_EQ(sizeSaidIn("FLV\1 filesize\0\x40\xB0\0\0\0\0\0\0"s), 4096);
    EXPECT_EQ(sizeSaidIn("FLV\1 filesize\0\0\0\0\0\0\0\0\0"s), std::nullopt);
    EXPECT_EQ(sizeSaidIn("FLV\1"s), std::nullopt);
}

} // namespace
