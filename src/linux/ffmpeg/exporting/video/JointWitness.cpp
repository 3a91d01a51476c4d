#include "linux/ffmpeg/exporting/video/JointWitness.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>
#include <limits>

namespace ffmpeg {

using base::Result;

namespace {

constexpr std::size_t kRemembered = 16; ///< packets of a group
constexpr std::size_t kCompared = 12;   ///< of them: decoders drop and spoil pictures right behind a bad joint

/// How many packets can be decoded without the others such that no picture is missing between those that they show.
std::size_t wholePrefix(const std::vector<Owned<AVPacket>>& packets)
{
    if (packets.size() <= kCompared)
        return packets.size();
    std::vector<std::int64_t> earliest(packets.size() + 1, std::numeric_limits<std::int64_t>::max());
    for (std::size_t i = packets.size(); i-- > 0;)
        earliest[i] = std::min(earliest[i + 1], packets[i]->pts);
    std::size_t best = 1;
    std::int64_t latest = std::numeric_limits<std::int64_t>::min();
    for (std::size_t i = 0; i < kCompared; ++i) {
        latest = std::max(latest, packets[i]->pts);
        if (latest < earliest[i + 1])
            best = i + 1;
    }
    return best;
}

base::ErrorRef noMemory()
{
    return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
}

} // namespace

Result<void> JointWitness::beginStretch(const AVCodecParameters& parameters)
{
    m_affinity.assertHere();
    Stretch& stretch = m_stretches.emplace_back();
    stretch.first.firstPacket = m_packets;
    if (!stretch.parameters.get() || avcodec_parameters_copy(stretch.parameters.get(), &parameters) < 0)
        return noMemory();
    return {};
}

Result<void> JointWitness::beginStretch(const AVCodecContext& encoder)
{
    m_affinity.assertHere();
    const Parameters parameters;
    if (!parameters.get() || avcodec_parameters_from_context(parameters.get(), &encoder) < 0)
        return noMemory();
    return beginStretch(*parameters.get());
}

void JointWitness::seePicture(const AVFrame& picture)
{
    m_affinity.assertHere();
    auto& given = m_stretches.back().given;
    if (given.size() < kCompared)
        given.push_back(PictureLook::of(picture));
}

void JointWitness::seePacket(const AVPacket& packet, bool beginsGroup)
{
    m_affinity.assertHere();
    Stretch& stretch = m_stretches.back();
    if (beginsGroup && m_packets > stretch.first.firstPacket) {
        stretch.last.firstPacket = m_packets;
        stretch.last.packets.clear();
    }
    if (m_packets == stretch.first.firstPacket || !stretch.first.packets.empty())
        add(stretch.first, packet);
    if (stretch.last.firstPacket > 0)
        add(stretch.last, packet);
    ++m_packets;
}

void JointWitness::add(Group& group, const AVPacket& packet)
{
    if (group.packets.size() >= kRemembered)
        return;
    if (Owned<AVPacket> same{av_packet_clone(&packet)})
        group.packets.push_back(std::move(same));
}

Result<JointSide> JointWitness::sideOf(const Stretch& stretch, const Group& group)
{
    JointSide side;
    side.firstPacket = group.firstPacket;
    std::vector<Owned<AVPacket>> packets;
    for (std::size_t i = 0; i < wholePrefix(group.packets); ++i)
        packets.emplace_back(av_packet_clone(group.packets[i].get()));
    side.packets = static_cast<std::int64_t>(packets.size());
    auto looks = looksOf(*stretch.parameters.get(), packets);
    if (!looks)
        return looks.error();
    side.looks = std::move(looks).value();
    const std::size_t given = &group == &stretch.first ? std::min(stretch.given.size(), packets.size()) : 0;
    for (std::size_t i = 0; i < given; ++i)
        if (i >= side.looks.size() || !areAlike(stretch.given[i], side.looks[i]))
            return cannotCopy("what is encoded does not look like what it is made of");
    return side;
}

Result<std::vector<Joint>> JointWitness::joints() const
{
    m_affinity.assertHere();
    std::vector<Joint> joints;
    for (std::size_t i = 0; i < m_stretches.size(); ++i) {
        if (i == 0 && m_stretches.size() > 1)
            continue; // its beginning is looked at with the joint behind it
        Joint& joint = joints.emplace_back();
        if (i > 0) {
            const Stretch& before = m_stretches[i - 1];
            auto side = sideOf(before, before.last.packets.empty() ? before.first : before.last);
            if (!side)
                return side.error();
            joint.before = std::move(side).value();
        }
        auto side = sideOf(m_stretches[i], m_stretches[i].first);
        if (!side)
            return side.error();
        joint.after = std::move(side).value();
    }
    return joints;
}

} // namespace ffmpeg
