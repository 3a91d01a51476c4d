// Ranges that end between the decoding and the showing of a picture: it must not stay in the file.
#include "linux/ffmpeg/exporting/CutsTest.h"

extern "C" {
#include <libavcodec/bsf.h>
}

namespace tests {
namespace {

struct Codec {
    const char* file;
    const char* splitter; ///< of FFmpeg, which takes packets apart into pictures
};

void PrintTo(const Codec& codec, std::ostream* stream)
{
    *stream << codec.file;
}

struct FreeingFilter {
    void operator()(AVBSFContext* filter) const { av_bsf_free(&filter); }
};

class HeldBackPictures : public CutsTest, public testing::WithParamInterface<Codec> {
protected:
    struct Packet {
        double seconds;
        bool isKey;
        int heldBack; ///< pictures in it beside the one that it shows
    };

    static std::vector<Packet> packetsOf(const std::string& path)
    {
        DecodedMovie file(path);
        AVBSFContext* made = nullptr;
        EXPECT_GE(av_bsf_alloc(av_bsf_get_by_name(GetParam().splitter), &made), 0);
        const std::unique_ptr<AVBSFContext, FreeingFilter> splitter(made);
        avcodec_parameters_copy(splitter->par_in, file.stream().codecpar);
        EXPECT_GE(av_bsf_init(splitter.get()), 0);
        std::vector<Packet> packets;
        const auto packet = ffmpeg::newPacket();
        while (av_read_frame(&file.context(), packet.get()) >= 0) {
            packets.push_back(
                {double(packet->pts) * av_q2d(file.stream().time_base), (packet->flags & AV_PKT_FLAG_KEY) != 0, -1});
            EXPECT_GE(av_bsf_send_packet(splitter.get(), packet.get()), 0);
            while (av_bsf_receive_packet(splitter.get(), packet.get()) >= 0) {
                ++packets.back().heldBack;
                av_packet_unref(packet.get());
            }
        }
        return packets;
    }

    void checkFile() override
    {
        for (const Packet& each : packetsOf(output()))
            EXPECT_EQ(each.heldBack, 0) << "at " << each.seconds;
    }
};

TEST_P(HeldBackPictures, StayInNoFileThatDoesNotShowThem)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam().file)));
    double group = 0;
    int tried = 0;
    for (const Packet& each : packetsOf(movie)) {
        group = each.isKey ? each.seconds : group;
        if (each.heldBack == 0 || group > 1.5)
            continue;
        // The picture is shown more than two pictures later.
        for (const int shown : {1, 2}) {
            cutAndCheck(group, each.seconds + shown / 30.0 - 0.01);
            if (group > 0)
                cutAndCheck(group - 0.1, each.seconds + shown / 30.0 - 0.01);
            ++tried;
        }
    }
    EXPECT_GE(tried, 4);
    EXPECT_GT(copies, 50);
    EXPECT_FALSE(saysEncodedAsAWhole());
}

INSTANTIATE_TEST_SUITE_P(, HeldBackPictures,
                         testing::Values(Codec{"vp9-hidden.webm", "vp9_superframe_split"},
                                         Codec{"av1-hidden.mkv", "av1_frame_split"}),
                         [](const auto& each) { return std::string(each.param.file).substr(0, 3); });

} // namespace
} // namespace tests
