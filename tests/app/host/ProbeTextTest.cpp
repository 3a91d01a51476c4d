// What `clipsa probe` says of a movie, word for word.
#include "app/host/ProbeMovie.h"

#include <gtest/gtest.h>

namespace {

ffmpeg::MovieFacts plainFacts()
{
    ffmpeg::MovieFacts facts;
    facts.container = "Matroska / WebM";
    return facts;
}

ffmpeg::PictureFacts plainPicture()
{
    ffmpeg::PictureFacts picture;
    picture.codec = "vp9";
    picture.format = "gray";
    picture.width = picture.displayWidth = 10;
    picture.height = picture.displayHeight = 20;
    picture.count = 1;
    picture.keyframes = 1;
    return picture;
}

/// All that can be known.
ffmpeg::MovieFacts fullFacts()
{
    ffmpeg::MovieFacts facts;
    facts.container = "MP4";
    facts.duration = 3725.5;
    facts.isCutOff = true;
    facts.durationBeforeCut = 59.9994;
    facts.bytes = 12'345'678;
    facts.bitRate = 26'499;
    ffmpeg::PictureFacts picture;
    picture.codec = "h264";
    picture.profile = "High";
    picture.format = "yuv420p";
    picture.width = picture.displayHeight = 1920;
    picture.height = picture.displayWidth = 1080;
    picture.rotation = 90;
    picture.count = 90;
    picture.rate = 29.97;
    picture.shortest = 0.0334;
    picture.longest = 12;
    picture.isVariable = true;
    picture.keyframes = 8;
    picture.shortestGroup = 0.5;
    picture.medianGroup = 1;
    picture.longestGroup = 2;
    picture.bitRate = 10'000'000;
    facts.picture = picture;
    facts.sounds = {{"aac", "Microphone", "eng", "stereo", 48000, 2, 128'500, true},
                    {"opus", "", "", "mono", 44100, 1, 0, false}};
    facts.others = {{"subtitle", "mov_text"}, {"data", "bin"}};
    return facts;
}

std::string lineOf(const ffmpeg::MovieFacts& facts, const std::string& what)
{
    const std::string text = host::wordsAbout("f", facts);
    const std::size_t start = text.find(what);
    return start == std::string::npos ? "" : text.substr(start, text.find('\n', start) - start);
}

TEST(TheWordsAboutAMovie, AreAllThatIsKnown)
{
    EXPECT_EQ(host::wordsAbout("a.mp4", fullFacts()),
              "Movie      a.mp4\n"
              "Container  MP4\n"
              "Length     1:02:05.500\n"
              "           cut off: its header tells of 59.999 s\n"
              "Size       12.3 MB, 26 kbit/s\n"
              "Picture    h264 (High), 1920×1080, yuv420p, shown turned by 90° clockwise, as 1080×1920, 10.0 Mbit/s\n"
              "           90 pictures, 29.97 a second on average; each stands 33 to 12000 ms\n"
              "           8 keyframes, 1.00 s apart (0.50 to 2.00 s)\n"
              "Sound      aac, “Microphone”, eng, 48000 Hz, stereo, 129 kbit/s\n"
              "Sound      opus, 44100 Hz, mono; it cannot be decoded\n"
              "Other      subtitle, mov_text\n"
              "Other      data, bin\n");
}

TEST(TheWordsAboutAMovie, AreNoMoreThanWhatIsKnown)
{
    auto facts = plainFacts();
    EXPECT_EQ(host::wordsAbout("b", facts), "Movie      b\n"
                                            "Container  Matroska / WebM\n"
                                            "Length     0.000 s\n"
                                            "Size       0.0 kB\n");
    facts.picture = plainPicture();
    facts.isCutOff = true;
    EXPECT_EQ(host::wordsAbout("b", facts), "Movie      b\n"
                                            "Container  Matroska / WebM\n"
                                            "Length     0.000 s\n"
                                            "           cut off: the rest of its file is missing\n"
                                            "Size       0.0 kB\n"
                                            "Picture    vp9, 10×20, gray\n"
                                            "           1 picture\n"
                                            "           1 keyframe\n");
}

TEST(TheWordsAboutAMovie, TellOfPicturesThatStandEquallyLong)
{
    auto facts = plainFacts();
    facts.picture = plainPicture();
    facts.picture->count = 2;
    facts.picture->rate = 0.5;
    facts.picture->keyframes = 2;
    facts.picture->shortestGroup = facts.picture->medianGroup = facts.picture->longestGroup = 0.25;
    const std::string text = host::wordsAbout("b", facts);
    EXPECT_NE(text.find("\n           2 pictures, 0.50 a second\n"
                        "           2 keyframes, 0.25 s apart (0.25 to 0.25 s)\n"),
              std::string::npos)
        << text;
}

TEST(TheWordsAboutAMovie, TellOfPicturesThatStandLong)
{
    auto facts = plainFacts();
    facts.picture = plainPicture();
    facts.picture->isVariable = true;
    facts.picture->shortest = 1.5;
    facts.picture->longest = 2;
    EXPECT_EQ(lineOf(facts, "1 picture"), "1 picture, 0.00 a second on average; each stands 1500 to 2000 ms");
}

TEST(TheWordsAboutAMovie, TellHowItIsShownIfThatIsOtherwise)
{
    auto facts = plainFacts();
    facts.picture = plainPicture();
    facts.picture->displayWidth = 11;
    EXPECT_EQ(lineOf(facts, "Picture"), "Picture    vp9, 10×20, gray, as 11×20");
    facts.picture = plainPicture();
    facts.picture->displayHeight = 21;
    EXPECT_EQ(lineOf(facts, "Picture"), "Picture    vp9, 10×20, gray, as 10×21");
    facts.picture = plainPicture();
    facts.picture->rotation = 180;
    EXPECT_EQ(lineOf(facts, "Picture"), "Picture    vp9, 10×20, gray, shown turned by 180° clockwise");
}

TEST(TheWordsAboutAMovie, HaveLengthsInTheirOwnUnits)
{
    auto facts = plainFacts();
    const std::pair<double, const char*> kLengths[] = {
        {0.5, "0.500 s"},        {59.75, "59.750 s"},   {60, "0:01:00.000"},     {61.25, "0:01:01.250"},
        {3599.5, "0:59:59.500"}, {3600, "1:00:00.000"}, {36'061, "10:01:01.000"}};
    for (const auto& [seconds, text] : kLengths) {
        facts.duration = seconds;
        EXPECT_EQ(lineOf(facts, "Length"), std::string("Length     ") + text);
        facts.isCutOff = true;
        facts.durationBeforeCut = seconds;
        EXPECT_EQ(lineOf(facts, "cut off"), std::string("cut off: its header tells of ") + text);
    }
}

TEST(TheWordsAboutAMovie, HaveSizesAndRatesInTheirOwnUnits)
{
    auto facts = plainFacts();
    const std::pair<std::int64_t, const char*> kSizes[] = {{1, "0.0 kB"},
                                                           {1'000, "1.0 kB"},
                                                           {999'999, "1000.0 kB"},
                                                           {1'000'000, "1.0 MB"},
                                                           {999'999'999, "1000.0 MB"},
                                                           {1'000'000'000, "1.00 GB"},
                                                           {12'345'000'000, "12.35 GB"}};
    for (const auto& [bytes, text] : kSizes) {
        facts.bytes = bytes;
        EXPECT_EQ(lineOf(facts, "Size"), std::string("Size       ") + text);
    }
    facts.bytes = 0;
    const std::pair<std::int64_t, const char*> kRates[] = {{-1, ""},
                                                           {0, ""},
                                                           {1, ", 0 kbit/s"},
                                                           {499, ", 0 kbit/s"},
                                                           {500, ", 1 kbit/s"},
                                                           {9'999'999, ", 10000 kbit/s"},
                                                           {10'000'000, ", 10.0 Mbit/s"},
                                                           {25'260'000, ", 25.3 Mbit/s"}};
    for (const auto& [rate, text] : kRates) {
        facts.bitRate = rate;
        EXPECT_EQ(lineOf(facts, "Size"), std::string("Size       0.0 kB") + text);
    }
}

TEST(TheObjectAboutAMovie, HasAllThatIsKnown)
{
    EXPECT_EQ(host::jsonAbout("a.mp4", fullFacts()),
              R"({"file":"a.mp4","container":"MP4","duration":3725.5,"cutOff":true,"durationBeforeCut":59.9994,)"
              R"("bytes":12345678,"bitRate":26499,"video":[{"codec":"h264","profile":"High","pixelFormat":"yuv420p",)"
              R"("width":1920,"height":1080,"displayWidth":1080,"displayHeight":1920,"rotation":90,"pictures":90,)"
              R"("averageRate":29.97,"variableRate":true,"shortestPicture":0.0334,"longestPicture":12,"keyframes":8,)"
              R"("shortestKeyframeDistance":0.5,"medianKeyframeDistance":1,"longestKeyframeDistance":2,)"
              R"("bitRate":10000000}],"audio":[{"codec":"aac","title":"Microphone","language":"eng",)"
              R"("sampleRate":48000,"channels":2,"layout":"stereo","bitRate":128500,"decodable":true},)"
              R"({"codec":"opus","sampleRate":44100,"channels":1,"layout":"mono","decodable":false}],)"
              R"("other":[{"kind":"subtitle","codec":"mov_text"},{"kind":"data","codec":"bin"}]})"
              "\n");
}

TEST(TheObjectAboutAMovie, LeavesOutWhatIsUnknown)
{
    auto facts = plainFacts();
    facts.picture = plainPicture();
    EXPECT_EQ(host::jsonAbout("b", facts),
              R"({"file":"b","container":"Matroska / WebM","duration":0,"bytes":0,"video":[{"codec":"vp9",)"
              R"("pixelFormat":"gray","width":10,"height":20,"displayWidth":10,"displayHeight":20,"rotation":0,)"
              R"("pictures":1,"variableRate":false,"keyframes":1}],"audio":[],"other":[]})"
              "\n");
}

TEST(TheObjectAboutAMovie, LeavesOutNothingForBeingSmall)
{
    auto facts = plainFacts();
    facts.durationBeforeCut = 0.5;
    facts.bitRate = 1;
    facts.picture = plainPicture();
    facts.picture->rate = facts.picture->longest = facts.picture->longestGroup = 0.5;
    facts.picture->bitRate = 1;
    facts.sounds = {{"aac", "", "", "mono", 8000, 1, 1, true}};
    EXPECT_EQ(host::jsonAbout("b", facts),
              R"({"file":"b","container":"Matroska / WebM","duration":0,"durationBeforeCut":0.5,"bytes":0,"bitRate":1,)"
              R"("video":[{"codec":"vp9","pixelFormat":"gray","width":10,"height":20,"displayWidth":10,)"
              R"("displayHeight":20,"rotation":0,"pictures":1,"averageRate":0.5,"variableRate":false,)"
              R"("shortestPicture":0,"longestPicture":0.5,"keyframes":1,"shortestKeyframeDistance":0,)"
              R"("medianKeyframeDistance":0,"longestKeyframeDistance":0.5,"bitRate":1}],"audio":[{"codec":"aac",)"
              R"("sampleRate":8000,"channels":1,"layout":"mono","bitRate":1,"decodable":true}],"other":[]})"
              "\n");
}

} // namespace
