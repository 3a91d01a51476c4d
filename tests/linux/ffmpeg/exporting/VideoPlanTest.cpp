// What is copied and what is encoded again, without any movie.
#include "linux/ffmpeg/exporting/video/VideoPlan.h"
#include "linux/ffmpeg/exporting/video/PictureLine.h"

#include <gmock/gmock.h>

namespace {

using ffmpeg::PacketWindow;
using ffmpeg::PicturePacket;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// One packet a word, in the order of decoding: the time, with J for a joint, O for one that can be made a joint, K for
/// another keyframe, H for one that an edit list hides, and + for one that holds a picture back.
PacketWindow window(const std::string& words, bool startsMovie = true, bool endsMovie = true)
{
    PacketWindow result;
    result.startsMovie = startsMovie;
    result.endsMovie = endsMovie;
    std::istringstream in(words);
    for (std::string word; in >> word;) {
        PicturePacket packet{std::stoll(word)};
        packet.isJoint = word.find('J') != std::string::npos;
        packet.isOpenJoint = word.find('O') != std::string::npos;
        packet.isKey = packet.isJoint || packet.isOpenJoint || word.find('K') != std::string::npos;
        packet.isHidden = word.find('H') != std::string::npos;
        packet.heldBack = word.find('+') != std::string::npos ? 1 : word.find('-') != std::string::npos ? -1 : 0;
        result.packets.push_back(packet);
    }
    return result;
}

ffmpeg::VideoPlan plan(const std::string& words, std::int64_t start, std::int64_t end)
{
    return ffmpeg::planVideo(window(words), window(words), start, end);
}

TEST(VideoPlan, CopiesWholeGroups)
{
    const auto found = plan("0J 1 2 3J 4 5 6J 7 8", 3, 6);
    ASSERT_TRUE(found.copies()) << found.reason;
    EXPECT_FALSE(found.encodesHead());
    EXPECT_EQ(found.copyFrom, 3);
    EXPECT_EQ(found.copyTo, 6);
    EXPECT_EQ(found.lastPts, 5);
    EXPECT_TRUE(found.isCutAtEnd);
    EXPECT_THAT(found.tail, IsEmpty());
}

TEST(VideoPlan, EncodesFromTheVisiblePictureUpToTheNextJoint)
{
    const auto found = plan("0J 10 20 30J 40 50", 15, 45);
    EXPECT_TRUE(found.encodesHead());
    EXPECT_EQ(found.firstPts, 10);
    EXPECT_EQ(found.copyFrom, 30);
    EXPECT_EQ(found.lastPts, 40);
}

TEST(VideoPlan, CopiesFromAJointThatIsVisibleAtTheStart)
{
    const auto found = plan("0J 10 20", 5, 100);
    EXPECT_FALSE(found.encodesHead());
    EXPECT_EQ(found.copyFrom, 0);
    EXPECT_FALSE(found.copyTo);
    EXPECT_FALSE(found.isCutAtEnd);
}

TEST(VideoPlan, DoesNotJoinWhereLaterPicturesLookBack)
{
    EXPECT_THAT(plan("0J 1 2 5K 3 4 6 7", 1, 7).reason, HasSubstr("no group of pictures begins"));
    EXPECT_EQ(plan("0J 1 2 5K 3 4 6 9J 10", 1, 11).copyFrom, 9);
    EXPECT_THAT(plan("0J 1 2 5J 3 4 6 7", 1, 7).reason, HasSubstr("no group of pictures begins"));
}

TEST(VideoPlan, JoinsAnOpenGroupWithoutWhatIsShownBeforeItsFirstPicture)
{
    const auto found = plan("0J 1 2 6O 4 3 5 7 8", 1, 9);
    ASSERT_TRUE(found.copies()) << found.reason;
    EXPECT_TRUE(found.joinsOpenGroup);
    EXPECT_EQ(found.firstPts, 1);
    EXPECT_EQ(found.copyFrom, 6);
    EXPECT_EQ(found.lastCopied, 8);
    EXPECT_THAT(found.tail, IsEmpty());
    EXPECT_THAT(plan("0J 1 2 6O 4 3 5 9 7 8", 4, 8).tail, ElementsAre(7));
    EXPECT_FALSE(plan("0J 1 2 6O 4 3 5 7 8", 6, 9).encodesHead());
    // What nobody looks past needs no making.
    EXPECT_FALSE(plan("0J 1 2 3JO 4 5", 1, 5).joinsOpenGroup);
    EXPECT_TRUE(plan("0J 1 4JO 2 3 5", 1, 6).joinsOpenGroup);
    // A picture that is shown before it comes late: it is not of its group.
    EXPECT_THAT(plan("0J 1 2 6O 4 3 7 5 8", 1, 9).reason, HasSubstr("no group of pictures begins"));
}

TEST(VideoPlan, TakesTheFirstPictureOfAllForAJointWhateverItsKind)
{
    EXPECT_EQ(plan("0K 1 2", 0, 3).copyFrom, 0);
    EXPECT_FALSE(ffmpeg::planVideo(window("0K 1 2", false), window("0K 1 2", false), 0, 3).copies());
}

TEST(VideoPlan, EncodesAgainWhatIsLeftOfReorderedPicturesAtTheEnd)
{
    // 3 needs 4, which lies behind the end.
    const auto found = plan("0J 2 1 4 3 6 5", 0, 4);
    EXPECT_EQ(found.copyTo, 4);
    EXPECT_EQ(found.lastCopied, 2);
    EXPECT_THAT(found.tail, ElementsAre(3));
    EXPECT_EQ(found.lastPts, 3);
    EXPECT_EQ(found.reorderDepth, 1);
    EXPECT_THAT(plan("0J 4 2 1 3 8 6 5 7", 0, 8).tail, ElementsAre(5, 6, 7));
    EXPECT_THAT(plan("0J 4 2 1 3 8 6 5 7", 0, 5).tail, IsEmpty());
    EXPECT_EQ(plan("0J 4 2 1 3 8 6 5 7", 0, 5).reorderDepth, 2);
}

TEST(VideoPlan, AsksForAnEarlierTailWhereNothingInItCanBeCopied)
{
    const auto head = window("0J 1 2 3J");
    const auto found = ffmpeg::planVideo(head, window("22K 20 21 23", false), 0, 21);
    EXPECT_TRUE(found.wantsEarlierTail);
    EXPECT_EQ(ffmpeg::planVideo(head, window("17J 18 19 22K 20 21 23", false), 0, 21).copyTo, 22);
}

TEST(VideoPlan, NeverCopiesHiddenPictures)
{
    const auto found = plan("-3JH -2H -1H 0 1 2J 3 4 5H", 0, 100);
    EXPECT_EQ(found.firstPts, 0);
    EXPECT_EQ(found.copyFrom, 2);
    EXPECT_EQ(found.copyTo, 5);
    EXPECT_EQ(found.lastPts, 4);
}

TEST(VideoPlan, EndsACopyWhereNoPictureIsHeldBack)
{
    EXPECT_THAT(plan("0J+ 1 2 3 4J 5", 0, 3).reason, HasSubstr("no picture can be copied"));
    EXPECT_EQ(plan("0J+ 1 2 3 4J 5 6", 0, 6).copyTo, 6);
    const auto found = plan("0J 1 2+ 3 4- 5 6", 0, 4);
    EXPECT_EQ(found.copyTo, 2);
    EXPECT_THAT(found.tail, ElementsAre(2, 3));
    EXPECT_EQ(plan("0J 1 2+ 3 4 5", 0, 4).copyTo, 2);
}

TEST(VideoPlan, CopiesHeldBackPicturesWhereNothingIsCutBehindThem)
{
    const auto found = plan("0J+ 1 2 3+ 4 5", 0, 100);
    ASSERT_TRUE(found.copies()) << found.reason;
    EXPECT_FALSE(found.copyTo);
    EXPECT_EQ(found.lastCopied, 5);
    EXPECT_THAT(found.tail, IsEmpty());
    EXPECT_FALSE(plan("0J 1 2 3J+ 4 5", 1, 6).copyTo);
    // An edit list cuts, too.
    EXPECT_EQ(plan("0J 1 2+ 3 4H", 0, 100).copyTo, 2);
}

TEST(VideoPlan, FindsWhereAnEditListLeavesOutPicturesOnTheWay)
{
    const auto gaps = [](const std::string& words) {
        std::vector<std::pair<std::int64_t, std::int64_t>> found;
        const auto all = ffmpeg::findGaps(window(words).packets);
        EXPECT_TRUE(all);
        for (const auto& each : all.value_or(std::vector<ffmpeg::VideoGap>{}))
            found.emplace_back(each.firstPts, each.joint.value_or(-1));
        return found;
    };
    EXPECT_THAT(gaps("0J 1 2 3J 4"), IsEmpty());
    EXPECT_THAT(gaps("0J 1 2H 2 3 4J 5"), ElementsAre(std::pair(2, 4)));
    EXPECT_THAT(gaps("0J 1 2H 3H 0H 1H 2 3 4J 5 6H 6 7J"), ElementsAre(std::pair(2, 4), std::pair(6, 7)));
    EXPECT_THAT(gaps("0J 1 2JH 3H 2J 3"), ElementsAre(std::pair(2, 2))) << "nothing to encode";
    EXPECT_THAT(gaps("0J 1 2H 2 3"), ElementsAre(std::pair(2, -1))) << "no joint follows";
    EXPECT_THAT(gaps("0J 1 2H 3H"), IsEmpty()) << "nothing is shown behind it";
    EXPECT_THAT(gaps("0J 2 1 5H 3 4 5 6J 8 7"), ElementsAre(std::pair(3, 6))) << "3 and 4 need what is hidden";
    EXPECT_THAT(gaps("0J 1 2H 5J 3 4 8J 9"), ElementsAre(std::pair(3, 8)))
        << "3 and 4 are shown before the first joint";
    EXPECT_FALSE(ffmpeg::findGaps(window("0J 5 6H 4 7J").packets)) << "4 is shown before one that is copied";
}

TEST(VideoPlan, TakesNoHiddenPictureForTheOneOfTheSameTime)
{
    const auto found = plan("0J 1 2 3 4H 0JH 1H 4 5J 6", 2, 7);
    EXPECT_EQ(found.firstPts, 2);
    EXPECT_EQ(found.copyFrom, 5);
    const auto cut = plan("0J 1 2 3 4H 0JH 1H 4 5", 0, 5);
    EXPECT_EQ(cut.copyTo, 4);
    EXPECT_TRUE(cut.copiesToHidden);
    EXPECT_THAT(cut.tail, ElementsAre(4));
}

TEST(VideoPlan, SaysWhyMostIsEncoded)
{
    const auto why = [](const std::string& words, std::int64_t start, std::int64_t end) {
        return ffmpeg::whyMostIsEncoded(plan(words, start, end), 2);
    };
    EXPECT_THAT(why("0J 1 2 3 4 5 6 7J 8 9", 1, 10), HasSubstr("begins late"));
    EXPECT_THAT(why("0J 1 2+ 3 4 5 6 7 8 9", 0, 9), HasSubstr("shown behind it"));
    EXPECT_EQ(why("0J 1 2 3 4 5 6 7J 8 9 10 11 12 13 14 15", 1, 16), "") << "less than a half";
    EXPECT_EQ(why("0J 1 2 3 4J 5", 1, 6), "") << "only for a moment";
    ffmpeg::VideoPlan found = plan("0J 1 2 3 4J 5 6 7 8 9 10 11", 0, 12);
    EXPECT_EQ(ffmpeg::whyMostIsEncoded(found, 2), "");
    found.gaps.push_back({2, 9});
    EXPECT_THAT(ffmpeg::whyMostIsEncoded(found, 2), HasSubstr("an edit list"));
}

TEST(VideoPlan, SaysWhyAllIsEncoded)
{
    EXPECT_THAT(plan("0J 1 1 2", 0, 2).reason, HasSubstr("the same time"));
    EXPECT_THAT(plan("5J 6", 0, 4).reason, HasSubstr("ends before the first picture"));
    EXPECT_THAT(plan("", 0, 4).reason, HasSubstr("no picture is shown"));
    EXPECT_THAT(plan("0J 1 2 3 4J", 1, 4).reason, HasSubstr("no group of pictures begins in the range"));
}

/// Gives each its time of decoding.
std::vector<std::int64_t> decodingTimes(int depth, const std::vector<std::int64_t>& shown, bool* fails = nullptr)
{
    ffmpeg::PictureLine line(depth, 10, std::nullopt, 1000);
    for (const std::int64_t pts : shown) {
        auto packet = ffmpeg::newPacket();
        packet->pts = pts;
        const auto done = line.push(std::move(packet), false);
        if (fails)
            *fails = *fails || !done;
    }
    line.finish();
    std::vector<std::int64_t> times;
    const auto packet = ffmpeg::newPacket();
    while (line.pop(*packet))
        times.push_back(packet->dts);
    return times;
}

TEST(PictureLine, DecodesPicturesBeforeTheyAreShown)
{
    EXPECT_THAT(decodingTimes(0, {0, 10, 25}), ElementsAre(0, 10, 25));
    EXPECT_THAT(decodingTimes(1, {0, 20, 10, 45, 30}), ElementsAre(-10, 0, 10, 20, 30));
    EXPECT_THAT(decodingTimes(2, {0, 40, 20, 10, 30}), ElementsAre(-20, -10, 0, 10, 20));
}

TEST(PictureLine, SaysWhenPicturesAreReorderedFartherThanItWasTold)
{
    bool fails = false;
    decodingTimes(1, {0, 40, 20, 10, 30}, &fails);
    EXPECT_TRUE(fails);
}

TEST(PictureLine, LetsNobodyBeginAtAKeyframeThatIsLookedPastSoonBeforeAnEnd)
{
    ffmpeg::PictureLine line(1, 10, std::nullopt, 1000);
    const auto push = [&](std::int64_t pts, bool isKey, bool isJoint) {
        auto packet = ffmpeg::newPacket();
        packet->pts = pts;
        packet->flags = isKey ? AV_PKT_FLAG_KEY : 0;
        EXPECT_TRUE(line.push(std::move(packet), isJoint));
    };
    // Two pictures follow the keyframe at 40, and one those at 10 and 70.
    for (const std::int64_t pts : {0, 10, 20, 30, 40, 50, 55, 60, 70, 80})
        push(pts, pts % 30 == 0 || pts % 30 == 10, pts % 30 == 0);
    line.finish();
    std::vector<std::int64_t> keyframes;
    const auto packet = ffmpeg::newPacket();
    while (line.pop(*packet))
        if (packet->flags & AV_PKT_FLAG_KEY)
            keyframes.push_back(packet->pts);
    EXPECT_THAT(keyframes, ElementsAre(0, 30, 40, 60));
}

TEST(PictureLine, EndsTheLastPictureWithTheRange)
{
    ffmpeg::PictureLine line(0, 10, 20, 23);
    for (const std::int64_t pts : {0, 10, 20}) {
        auto packet = ffmpeg::newPacket();
        packet->pts = pts;
        packet->duration = 10;
        EXPECT_TRUE(line.push(std::move(packet), false));
    }
    line.finish();
    std::vector<std::int64_t> durations;
    const auto packet = ffmpeg::newPacket();
    while (line.pop(*packet))
        durations.push_back(packet->duration);
    EXPECT_THAT(durations, ElementsAre(10, 10, 3));
}

} // namespace
