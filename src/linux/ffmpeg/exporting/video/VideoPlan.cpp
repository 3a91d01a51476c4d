#include "linux/ffmpeg/exporting/video/VideoPlan.h"

#include <algorithm>
#include <limits>
#include <set>

namespace ffmpeg {

namespace {

constexpr std::int64_t kBefore = std::numeric_limits<std::int64_t>::min();
constexpr std::int64_t kBehind = std::numeric_limits<std::int64_t>::max();

VideoPlan encodeAll(VideoPlan plan, std::string reason)
{
    plan.reason = std::move(reason);
    return plan;
}

/// Of the last picture that is shown at or before `start`, else of the first; nothing when there is none.
std::optional<std::int64_t> visibleAt(const std::vector<PicturePacket>& packets, std::int64_t start)
{
    std::optional<std::int64_t> visible;
    std::optional<std::int64_t> first;
    for (const PicturePacket& each : packets) {
        if (each.isHidden)
            continue;
        if (each.pts <= start)
            visible = std::max(visible.value_or(each.pts), each.pts);
        first = std::min(first.value_or(each.pts), each.pts);
    }
    return visible ? visible : first;
}

bool haveTimesOfTheirOwn(const std::vector<PicturePacket>& packets)
{
    std::set<std::int64_t> seen;
    return std::all_of(packets.begin(), packets.end(),
                       [&](const PicturePacket& each) { return each.isHidden || seen.insert(each.pts).second; });
}

struct Joint {
    std::size_t index;
    bool isOpen;
};

/// The first joint that shows no picture before `firstPts`, and behind which nothing earlier than itself is shown; but
/// right behind an open one there may be such.
std::optional<Joint> findJoint(const PacketWindow& head, std::int64_t firstPts)
{
    std::int64_t shown = kBefore;
    for (std::size_t i = 0; i < head.packets.size(); ++i) {
        const PicturePacket& each = head.packets[i];
        if (!each.isHidden && each.pts >= firstPts && each.pts > shown) {
            const auto isLater = [&](const PicturePacket& other) { return other.isHidden || other.pts > each.pts; };
            const auto behind = head.packets.begin() + static_cast<std::ptrdiff_t>(i) + 1;
            // The movie's first picture needs none before it, whatever its kind.
            if ((each.isJoint || (head.startsMovie && i == 0 && each.isKey))
                && std::all_of(behind, head.packets.end(), isLater))
                return Joint{i, false};
            if (each.isOpenJoint
                && std::all_of(std::find_if(behind, head.packets.end(), isLater), head.packets.end(), isLater))
                return Joint{i, true};
        }
        shown = each.isHidden ? shown : std::max(shown, each.pts);
    }
    return std::nullopt;
}

/// For each packet the earliest time at which one of those from it on is shown.
std::vector<std::int64_t> earliestShown(const std::vector<PicturePacket>& packets)
{
    std::vector<std::int64_t> earliest(packets.size() + 1, kBehind);
    for (std::size_t i = packets.size(); i-- > 0;)
        earliest[i] = packets[i].isHidden ? earliest[i + 1] : std::min(earliest[i + 1], packets[i].pts);
    return earliest;
}

/// How many of the packets from `begin` on can be copied.
std::size_t copyablePrefix(const std::vector<PicturePacket>& packets, std::size_t begin, std::int64_t end,
                           bool endsMovie)
{
    const auto earliest = earliestShown(packets);
    std::size_t best = 0;
    std::int64_t latest = kBefore;
    int heldBack = 0;
    for (std::size_t i = begin; i < packets.size(); ++i) {
        if (packets[i].isHidden || packets[i].pts >= end)
            break;
        heldBack = packets[i].isJoint ? packets[i].heldBack : heldBack + packets[i].heldBack;
        latest = std::max(latest, packets[i].pts);
        const bool isLast = i + 1 == packets.size();
        if (isLast ? endsMovie : heldBack <= 0 && latest < earliest[i + 1])
            best = i + 1 - begin;
    }
    return best;
}

} // namespace

int reorderDepthOf(const std::vector<PicturePacket>& packets)
{
    int depth = 0;
    std::vector<std::int64_t> before; // sorted
    for (const PicturePacket& each : packets) {
        if (each.isHidden)
            continue;
        const auto at = std::upper_bound(before.begin(), before.end(), each.pts);
        depth = std::max(depth, static_cast<int>(before.end() - at));
        before.insert(at, each.pts);
        constexpr std::size_t kEnough = 64; // more than any codec reorders
        if (before.size() > kEnough)
            before.erase(before.begin());
    }
    return depth;
}

std::optional<std::vector<VideoGap>> findGaps(const std::vector<PicturePacket>& packets)
{
    const auto earliest = earliestShown(packets);
    std::vector<VideoGap> gaps;
    std::int64_t copied = kBefore;
    for (std::size_t i = 0; i < packets.size() && earliest[i] != kBehind; ++i) {
        if (!packets[i].isHidden) {
            copied = std::max(copied, packets[i].pts);
            continue;
        }
        if (earliest[i] <= copied)
            return std::nullopt;
        VideoGap gap{earliest[i], std::nullopt};
        std::int64_t shown = copied;
        for (; i < packets.size() && !gap.joint; ++i) {
            const PicturePacket& each = packets[i];
            if (!each.isHidden && each.isJoint && each.pts > shown && earliest[i + 1] > each.pts)
                gap.joint = copied = each.pts;
            shown = each.isHidden ? shown : std::max(shown, each.pts);
        }
        --i;
        gaps.push_back(gap);
    }
    return gaps;
}

std::string whyMostIsEncoded(const VideoPlan& plan, std::int64_t second)
{
    constexpr std::int64_t kSecondsThatNobodyNotices = 2;
    std::int64_t inGaps = 0;
    for (const VideoGap& each : plan.gaps)
        inGaps += each.joint.value_or(each.firstPts) - each.firstPts;
    const std::int64_t head = plan.copyFrom - plan.firstPts;
    const std::int64_t tail = plan.tail.empty() ? 0 : plan.lastPts - plan.tail.front();
    const std::int64_t encoded = head + inGaps + tail;
    if (encoded <= kSecondsThatNobodyNotices * second || 2 * encoded <= plan.lastPts - plan.firstPts)
        return {};
    if (inGaps > std::max(head, tail))
        return "an edit list leaves out pictures on the way, and groups of them begin far behind";
    return head > tail ? "the first group of pictures in the range begins late"
                       : "pictures near the end of the range need others that are shown behind it";
}

VideoPlan planVideo(const PacketWindow& head, const PacketWindow& tail, std::int64_t start, std::int64_t end)
{
    VideoPlan plan;
    const auto first = visibleAt(head.packets, start);
    if (!first)
        return encodeAll(plan, "no picture is shown in the range");
    if (*first >= end)
        return encodeAll(plan, "the range ends before the first picture");
    plan.firstPts = *first;
    plan.reorderDepth = std::max(reorderDepthOf(head.packets), reorderDepthOf(tail.packets));
    if (!haveTimesOfTheirOwn(head.packets) || !haveTimesOfTheirOwn(tail.packets))
        return encodeAll(plan, "several pictures have the same time");

    const auto joint = findJoint(head, plan.firstPts);
    if (!joint || head.packets[joint->index].pts >= end)
        return encodeAll(plan, "no group of pictures begins in the range");
    plan.copyFrom = head.packets[joint->index].pts;
    plan.joinsOpenGroup = joint->isOpen;

    // Where both windows overlap, the stretch begins inside the tail's.
    const auto& packets = tail.packets;
    const auto found = std::find_if(packets.begin(), packets.end(), [&](const PicturePacket& each) {
        return !each.isHidden && each.pts == plan.copyFrom;
    });
    const auto begin = found == packets.end() ? std::size_t{0} : static_cast<std::size_t>(found - packets.begin());
    const std::size_t count = copyablePrefix(packets, begin, end, tail.endsMovie);
    if (count == 0) {
        if (found != packets.end() || tail.startsMovie)
            return encodeAll(plan, "no picture can be copied before the end of the range");
        plan.wantsEarlierTail = true;
        return plan;
    }
    plan.lastCopied = kBefore;
    for (std::size_t i = begin; i < begin + count; ++i)
        plan.lastCopied = std::max(plan.lastCopied, packets[i].pts);
    if (begin + count < packets.size()) {
        plan.copyTo = packets[begin + count].pts;
        plan.copiesToHidden = packets[begin + count].isHidden;
    }
    for (std::size_t i = begin + count; i < packets.size(); ++i) {
        if (!packets[i].isHidden && packets[i].pts < end)
            plan.tail.push_back(packets[i].pts);
        plan.isCutAtEnd = plan.isCutAtEnd || packets[i].pts >= end;
    }
    std::sort(plan.tail.begin(), plan.tail.end());
    plan.lastPts = plan.tail.empty() ? plan.lastCopied : plan.tail.back();
    return plan;
}

} // namespace ffmpeg
