/// A fixture that asks the real media engine for pictures and keeps its answers.
#pragma once

#include "linux/ffmpeg/FFmpegImageGenerator.h"
#include "support/EngineTest.h"

#include <algorithm>
#include <filesystem>
#include <mutex>
#include <string>
#include <thread>
#include <unistd.h>
#include <utility>
#include <vector>

namespace tests {

/// As the helper that reads numbers wants it.
inline Pixels pixelsOf(const platform::Bitmap& bitmap)
{
    Pixels pixels{bitmap.width, bitmap.height, bitmap.rgba};
    for (std::size_t i = 0; i + 3 < pixels.bytes.size(); i += 4)
        std::swap(pixels.bytes[i], pixels.bytes[i + 2]);
    return pixels;
}

class ImageTest : public EngineTest {
protected:
    using Result = platform::ImageGenerator::Result;

    struct Answer {
        MediaTime requested, actual;
        platform::ImageRef image;
        Result result;
        base::ErrorRef error;
        std::thread::id thread;

        int number() const { return image ? numberIn(pixelsOf(image->bitmap())) : -1; }
    };

    void TearDown() override { std::filesystem::remove(copy); }

    void use(const std::string& path)
    {
        asset = media.assetWithURL(base::Url::fromPath(path));
        generator = std::dynamic_pointer_cast<ffmpeg::FFmpegImageGenerator>(media.imageGeneratorWithAsset(asset));
        const std::lock_guard lock(mutex);
        answers.clear();
    }
    platform::ImageGenerator::Handler keep()
    {
        return [this](MediaTime requested, const platform::ImageRef& image, MediaTime actual, Result result,
                      const base::ErrorRef& error) {
            {
                const std::lock_guard lock(mutex);
                answers.push_back({requested, actual, image, result, error, std::this_thread::get_id()});
            }
            mainQueue.post([] {});
        };
    }
    void ask(MediaTime time) { generator->generateImagesAsynchronouslyForTimes({time}, keep()); }
    std::size_t count()
    {
        const std::lock_guard lock(mutex);
        return answers.size();
    }
    bool waitForAnswers(std::size_t number)
    {
        return waitFor([&] { return count() >= number; });
    }
    /// The one picture of `time`.
    Answer answerAt(MediaTime time)
    {
        const std::size_t before = count();
        ask(time);
        EXPECT_TRUE(waitForAnswers(before + 1));
        const std::lock_guard lock(mutex);
        return answers.size() > before ? answers.back() : Answer{};
    }
    int imageNumberAt(MediaTime time) { return answerAt(time).number(); }

    std::mutex mutex;
    std::vector<Answer> answers;
    std::shared_ptr<ffmpeg::FFmpegImageGenerator> generator;
    const std::string copy = testing::TempDir() + "images-" + std::to_string(getpid()) + ".mp4";
};

} // namespace tests
