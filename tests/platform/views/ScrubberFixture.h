/// A scrubber in a window, over a movie that writes down what it is told and asked.
#pragma once

#include "platform/views/MovieScrubber.h"
#include "support/EnglishWords.h"

#include "Fixture.h"

#include <cmath>

namespace tests {

struct Movie final : platform::MovieScrubberDataSource, platform::MovieScrubberDelegate {
    double movieScrubberDuration(platform::MovieScrubber&) override { return duration; }
    std::vector<double> movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(platform::MovieScrubber&,
                                                                                 std::int32_t count, double start,
                                                                                 double end) override
    {
        std::vector<double> timestamps;
        for (std::int32_t i = 0; i < count; ++i)
            timestamps.push_back(start + (end - start) * i / count);
        return timestamps;
    }
    double movieScrubberThumbnailAspectRatio(platform::MovieScrubber&) override { return aspectRatio; }
    void movieScrubber_requestThumbnailImageForTimestamp(platform::MovieScrubber&, double timestamp) override
    {
        requested.push_back(timestamp);
    }

    void movieScrubber_valueDidChange(platform::MovieScrubber&, double seconds) override { say("value", seconds); }
    void movieScrubberDidBeginScrubbing_withHandle(platform::MovieScrubber&, int handle) override
    {
        say("begin", handle);
        if (onBegin)
            onBegin();
    }
    void movieScrubberDidEndScrubbing_withHandle(platform::MovieScrubber&, int handle) override { say("end", handle); }
    void movieScrubber_editingStartValueDidChange(platform::MovieScrubber&, double seconds) override
    {
        say("start", seconds);
    }
    void movieScrubber_editingEndValueDidChange(platform::MovieScrubber&, double seconds) override
    {
        say("finish", seconds);
    }
    void movieScrubberDidBeginEditing(platform::MovieScrubber&) override
    {
        said.emplace_back("editing");
        if (onEditing)
            onEditing();
    }
    void movieScrubberDidCancelEditing(platform::MovieScrubber&) override { said.emplace_back("cancelled"); }

    void say(const std::string& what, double number)
    {
        said.push_back(what + " " + std::to_string(std::lround(number)));
    }

    double duration = 30;
    double aspectRatio = 0.5;
    std::vector<double> requested;
    std::vector<std::string> said;
    std::function<void()> onBegin;
    std::function<void()> onEditing;
};

struct Scrubbers : WindowFixture {
    std::shared_ptr<Movie> movie = std::make_shared<Movie>();
    EnglishWords words;
    std::shared_ptr<platform::MovieScrubber> scrubber = std::make_shared<platform::MovieScrubber>(words);

    Scrubbers()
    {
        scrubber->setFrame(base::Rect::make(0, 100, 320, 38));
        scrubber->setEdgeInset(10);
        scrubber->setDataSource(movie);
        scrubber->setDelegate(movie);
        window->addSubview(scrubber);
    }
    static platform::ImageRef picture()
    {
        return std::make_shared<const platform::Image>(platform::Bitmap::transparent(1, 1), 1.0);
    }
};

} // namespace tests
