/// What decodes pictures over VA-API, on machines that have it. Any thread.
///
/// Pictures that it has decoded are copied to the system's memory, where everything else reads them. A codec that it
/// does not know, and one that fails in it at the start, is decoded by the processor without a word.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <memory>

namespace ffmpeg {

class HardwareDevice {
public:
    /// This machine's, looked for once; null when there is none.
    static const HardwareDevice* shared();
    /// The one behind a node such as "/dev/dri/renderD128"; null when that cannot decode.
    static std::unique_ptr<HardwareDevice> open(const char* node);
    ~HardwareDevice() { av_buffer_unref(&m_device); }
    HardwareDevice(const HardwareDevice&) = delete;
    HardwareDevice& operator=(const HardwareDevice&) = delete;

    /// `context` uses it, where it can. Before the codec is opened.
    void offerTo(AVCodecContext& context) const;
    /// `frame`, in the system's memory. Null when that is impossible.
    static Owned<AVFrame> inMemory(Owned<AVFrame> frame);

private:
    explicit HardwareDevice(AVBufferRef* device) : m_device(device) {}

    AVBufferRef* m_device;
};

} // namespace ffmpeg
