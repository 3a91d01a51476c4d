/// A file that sound is written to, closed with its last owner.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace tests {

struct ClosingOutput {
    void operator()(AVFormatContext* context) const
    {
        if (context->pb)
            avio_closep(&context->pb);
        avformat_free_context(context);
    }
};
using Output = std::unique_ptr<AVFormatContext, ClosingOutput>;

/// The container is told by the name's ending.
inline Output newOutput(const std::string& path)
{
    AVFormatContext* context = nullptr;
    EXPECT_GE(avformat_alloc_output_context2(&context, nullptr, nullptr, path.c_str()), 0) << path;
    Output output(context);
    EXPECT_GE(avio_open(&context->pb, path.c_str(), AVIO_FLAG_WRITE), 0) << path;
    return output;
}

} // namespace tests
