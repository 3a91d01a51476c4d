/// Which pictures of a range are copied and which are encoded again. A pure function; any thread.
///
/// A copied stretch begins at a joint, a picture that nothing before it is needed for and nothing behind it looks past,
/// and ends with the movie, or where no picture that is left out would be shown before one that is kept, and none is held
/// back. What lies in the range before and behind that stretch is encoded again: so no picture outside of the range gets
/// into the output.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace ffmpeg {

/// A packet of the picture stream. Times are ticks of the output on the movie's time line.
struct PicturePacket {
    std::int64_t pts;
    bool isKey = false;
    bool isJoint = false;
    /// It can be made a joint by leaving out what is decoded behind it and shown before it.
    bool isOpenJoint = false;
    bool isHidden = false; ///< decoded but not shown: an edit list left it out
    int heldBack = 0;      ///< pictures in it that are shown later, less those that it shows of earlier ones
};

/// Packets that follow each other in the order of decoding.
struct PacketWindow {
    std::vector<PicturePacket> packets;
    bool startsMovie = false; ///< its first is the first of the stream
    bool endsMovie = false;   ///< its last is the last of the stream
};

/// Where an edit list leaves out pictures on the way: what it shows behind them up to the next joint is encoded.
struct VideoGap {
    std::int64_t firstPts = 0;         ///< the first picture that is shown and cannot be copied, or the joint
    std::optional<std::int64_t> joint; ///< copying goes on there; nothing when it does not
    bool encodes() const { return firstPts != joint; }
};

struct VideoPlan {
    /// Why all pictures are encoded; empty when some are copied.
    std::string reason;
    /// The tail's window did not go back far enough: try again with one that does.
    bool wantsEarlierTail = false;

    /// The first picture: the one that is visible at the start, whose time is clipped to it.
    std::int64_t firstPts = 0;
    /// The joint. Pictures from the first up to here are encoded.
    std::int64_t copyFrom = 0;
    /// The joint must be made one: pictures that follow it and are shown before it are encoded, not copied.
    bool joinsOpenGroup = false;
    /// In between, in their order.
    std::vector<VideoGap> gaps;
    /// The first packet, in the order of decoding, that is not copied. Nothing: up to the end of the stream.
    std::optional<std::int64_t> copyTo;
    /// That packet is the first behind all gaps that an edit list hides.
    bool copiesToHidden = false;
    /// The last picture, in the order of presentation, that is copied.
    std::int64_t lastCopied = 0;
    /// Pictures behind the copied ones that are encoded.
    std::vector<std::int64_t> tail;
    /// The last picture of the output.
    std::int64_t lastPts = 0;
    /// Whether the stream has pictures behind the output's last.
    bool isCutAtEnd = false;
    /// How many pictures at most are shown later than one that is decoded behind them, in what was looked at.
    int reorderDepth = 0;

    bool copies() const { return reason.empty(); }
    bool encodesHead() const { return copyFrom > firstPts; }
};

/// `head` starts with a keyframe at or before the picture visible at `start` (or with the movie) and reaches up to a
/// joint behind it, `end` or the end. `tail` starts with a keyframe before `end` and reaches so far behind it that all
/// that follows is shown later.
VideoPlan planVideo(const PacketWindow& head, const PacketWindow& tail, std::int64_t start, std::int64_t end);

/// The gaps in what lies between the joint, with which `packets` starts, and the last picture. Nothing when the pictures
/// around one are too entangled.
std::optional<std::vector<VideoGap>> findGaps(const std::vector<PicturePacket>& packets);

/// Why more is encoded than somebody expects who knows that movies are copied; empty where it is as expected. `second` is
/// in ticks.
std::string whyMostIsEncoded(const VideoPlan& plan, std::int64_t second);

/// How many packets that are shown later precede one in the order of decoding, at most. What is hidden is not counted.
int reorderDepthOf(const std::vector<PicturePacket>& packets);

} // namespace ffmpeg
