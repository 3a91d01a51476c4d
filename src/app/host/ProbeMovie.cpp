#include "app/host/ProbeMovie.h"

#include "app/host/ExitStatus.h"
#include "app/host/JsonObject.h"
#include "app/host/MediaTool.h"
#include "base/Text.h"
#include "linux/ffmpeg/FFmpegAsset.h"

#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <memory>
#include <optional>
#include <utility>

namespace host {

namespace {

[[gnu::format(printf, 1, 2)]] std::string formatted(const char* format, ...)
{
    char text[256];
    std::va_list values;
    va_start(values, format);
    std::vsnprintf(text, sizeof text, format, values);
    va_end(values);
    return text;
}

std::string line(const std::string& what, const std::string& text)
{
    return formatted("%-11s", what.c_str()) + base::printable(text) + "\n";
}

std::string bitRate(std::int64_t rate)
{
    if (rate <= 0)
        return "";
    return rate < 10'000'000 ? formatted(", %lld kbit/s", static_cast<long long>((rate + 500) / 1000))
                             : formatted(", %.1f Mbit/s", double(rate) / 1e6);
}

std::string size(std::int64_t bytes)
{
    if (bytes < 1'000'000)
        return formatted("%.1f kB", double(bytes) / 1e3);
    return bytes < 1'000'000'000 ? formatted("%.1f MB", double(bytes) / 1e6)
                                 : formatted("%.2f GB", double(bytes) / 1e9);
}

std::string length(double seconds)
{
    const auto whole = static_cast<long long>(seconds);
    if (whole < 60)
        return formatted("%.3f s", seconds);
    return formatted("%lld:%02lld:%06.3f", whole / 3600, whole / 60 % 60, seconds - double(whole - whole % 60));
}

std::string aboutPicture(const ffmpeg::PictureFacts& facts)
{
    std::string first = facts.codec + (facts.profile.empty() ? "" : " (" + facts.profile + ")")
                        + formatted(", %d×%d, ", facts.width, facts.height) + facts.format;
    if (facts.rotation != 0)
        first += formatted(", shown turned by %d° clockwise", facts.rotation);
    if (facts.displayWidth != facts.width || facts.displayHeight != facts.height)
        first += formatted(", as %d×%d", facts.displayWidth, facts.displayHeight);
    std::string text = line("Picture", first + bitRate(facts.bitRate));

    std::string rate =
        formatted("%lld %s", static_cast<long long>(facts.count), facts.count == 1 ? "picture" : "pictures");
    if (facts.isVariable)
        rate += formatted(", %.2f a second on average; each stands %.0f to %.0f ms", facts.rate, facts.shortest * 1000,
                          facts.longest * 1000);
    else if (facts.rate > 0)
        rate += formatted(", %.2f a second", facts.rate);
    text += line("", rate);

    std::string keys =
        facts.keyframes == 1 ? "1 keyframe" : formatted("%lld keyframes", static_cast<long long>(facts.keyframes));
    if (facts.longestGroup > 0)
        keys +=
            formatted(", %.2f s apart (%.2f to %.2f s)", facts.medianGroup, facts.shortestGroup, facts.longestGroup);
    return text + line("", keys);
}

std::string aboutSound(const ffmpeg::SoundFacts& facts)
{
    std::string text = facts.codec;
    if (!facts.title.empty())
        text += ", “" + facts.title + "”";
    if (!facts.language.empty())
        text += ", " + facts.language;
    text += formatted(", %d Hz, ", facts.rate) + facts.layout + bitRate(facts.bitRate);
    return line("Sound", facts.isHeard ? text : text + "; it cannot be decoded");
}

std::string jsonAboutPicture(const ffmpeg::PictureFacts& facts)
{
    JsonObject object;
    object.add("codec", facts.codec).addUnlessEmpty("profile", facts.profile).add("pixelFormat", facts.format);
    object.add("width", facts.width).add("height", facts.height);
    object.add("displayWidth", facts.displayWidth).add("displayHeight", facts.displayHeight);
    object.add("rotation", facts.rotation).add("pictures", facts.count);
    if (facts.rate > 0)
        object.add("averageRate", facts.rate);
    object.addFlag("variableRate", facts.isVariable);
    if (facts.longest > 0)
        object.add("shortestPicture", facts.shortest).add("longestPicture", facts.longest);
    object.add("keyframes", facts.keyframes);
    if (facts.longestGroup > 0)
        object.add("shortestKeyframeDistance", facts.shortestGroup)
            .add("medianKeyframeDistance", facts.medianGroup)
            .add("longestKeyframeDistance", facts.longestGroup);
    if (facts.bitRate > 0)
        object.add("bitRate", facts.bitRate);
    return object.text();
}

std::string jsonAboutSound(const ffmpeg::SoundFacts& facts)
{
    JsonObject object;
    object.add("codec", facts.codec).addUnlessEmpty("title", facts.title).addUnlessEmpty("language", facts.language);
    object.add("sampleRate", facts.rate).add("channels", facts.channels).add("layout", facts.layout);
    if (facts.bitRate > 0)
        object.add("bitRate", facts.bitRate);
    return object.addFlag("decodable", facts.isHeard).text();
}

/// On a worker, so that a signal can come between.
base::Result<ffmpeg::MovieFacts> factsOf(MediaTool& tool, const platform::Asset& asset)
{
    using Facts = base::Result<ffmpeg::MovieFacts>;
    const auto movie = dynamic_cast<const ffmpeg::FFmpegAsset&>(asset).movie();
    const auto cancelled = std::make_shared<std::atomic<bool>>(false);
    const auto facts = std::make_shared<std::optional<Facts>>(); // the task may still run when a signal has come
    base::MainQueue& main = tool.system().mainQueue;
    tool.system().defaultQueue.post([=, &main] {
        auto found = std::make_shared<Facts>(ffmpeg::MovieFacts::of(*movie, cancelled));
        main.post([facts, found] { *facts = std::move(*found); });
    });
    if (tool.runUntil([&] { return facts->has_value(); }))
        return std::move(**facts);
    *cancelled = true;
    return base::Error::fromErrno(ECANCELED, "cannot look at the movie");
}

} // namespace

std::string wordsAbout(const std::string& file, const ffmpeg::MovieFacts& facts)
{
    std::string text = line("Movie", file);
    text += line("Container", facts.container);
    text += line("Length", length(facts.duration));
    if (facts.isCutOff)
        text += line("", facts.durationBeforeCut > 0 ? "cut off: its header tells of " + length(facts.durationBeforeCut)
                                                     : std::string("cut off: the rest of its file is missing"));
    text += line("Size", size(facts.bytes) + bitRate(facts.bitRate));
    if (facts.picture)
        text += aboutPicture(*facts.picture);
    for (const auto& each : facts.sounds)
        text += aboutSound(each);
    for (const auto& each : facts.others)
        text += line("Other", each.kind + ", " + each.codec);
    return text;
}

std::string jsonAbout(const std::string& file, const ffmpeg::MovieFacts& facts)
{
    JsonObject object;
    object.add("file", file).add("container", facts.container).add("duration", facts.duration);
    if (facts.isCutOff)
        object.addFlag("cutOff", true);
    if (facts.durationBeforeCut > 0)
        object.add("durationBeforeCut", facts.durationBeforeCut);
    object.add("bytes", facts.bytes);
    if (facts.bitRate > 0)
        object.add("bitRate", facts.bitRate);
    std::vector<std::string> pictures;
    std::vector<std::string> sounds;
    std::vector<std::string> others;
    if (facts.picture)
        pictures.push_back(jsonAboutPicture(*facts.picture));
    for (const auto& each : facts.sounds)
        sounds.push_back(jsonAboutSound(each));
    for (const auto& each : facts.others)
        others.push_back(JsonObject().add("kind", each.kind).add("codec", each.codec).text());
    return object.addList("video", pictures).addList("audio", sounds).addList("other", others).text() + "\n";
}

int probeMovie(const ProbeCommand& command)
{
    MediaTool tool;
    const auto asset = tool.open(command.movie);
    if (!asset)
        return tool.fail(asset.error());
    const auto facts = factsOf(tool, *asset.value());
    if (!facts)
        return tool.fail(facts.error());
    const auto about = command.json ? jsonAbout : wordsAbout;
    std::fputs(about(command.movie, facts.value()).c_str(), stdout);
    return kExitDone;
}

} // namespace host
