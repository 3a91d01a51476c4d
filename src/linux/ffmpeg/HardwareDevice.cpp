#include "linux/ffmpeg/HardwareDevice.h"

#include <unistd.h>

namespace ffmpeg {

const HardwareDevice* HardwareDevice::shared()
{
    static const auto device = open("/dev/dri/renderD128"); // the first node; others are those of second cards
    return device.get();
}

std::unique_ptr<HardwareDevice> HardwareDevice::open(const char* node)
{
    AVBufferRef* device = nullptr;
    if (access(node, R_OK | W_OK) != 0 || av_hwdevice_ctx_create(&device, AV_HWDEVICE_TYPE_VAAPI, node, nullptr, 0) < 0)
        return nullptr;
    return std::unique_ptr<HardwareDevice>(new HardwareDevice(device));
}

void HardwareDevice::offerTo(AVCodecContext& context) const
{
    // The library takes it for what it can decode, and takes it back where that fails at the start.
    context.hw_device_ctx = av_buffer_ref(m_device);
}

Owned<AVFrame> HardwareDevice::inMemory(Owned<AVFrame> frame)
{
    if (!frame->hw_frames_ctx)
        return frame;
    Owned<AVFrame> copy = newFrame();
    if (av_hwframe_transfer_data(copy.get(), frame.get(), 0) < 0 || av_frame_copy_props(copy.get(), frame.get()) < 0)
        return nullptr;
    return copy;
}

} // namespace ffmpeg
