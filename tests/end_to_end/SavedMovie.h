/// What a saved movie says when the ffmpeg command decodes it: its pictures' numbers, and how loud a tone is in it.
#pragma once

#include "support/Child.h"

#include <cmath>
#include <cstring>
#include <filesystem>
#include <numbers>
#include <string>
#include <vector>

namespace tests {

inline std::string decoded(const std::filesystem::path& movie, std::vector<std::string> options)
{
    std::vector<std::string> words = {"ffmpeg", "-nostdin", "-v", "error", "-xerror", "-i", movie};
    words.insert(words.end(), options.begin(), options.end());
    words.emplace_back("-");
    Child ffmpeg(words, {"PATH=/usr/bin:/bin"});
    const auto end = ffmpeg.wait();
    return end.exitStatus == 0 && end.err.empty() ? end.out : std::string();
}

/// Of the pictures in order, as tests/movies/README.md describes them; 640 by 360 pixels. Empty when a decoder complains.
inline std::vector<int> numbersIn(const std::filesystem::path& movie)
{
    constexpr std::size_t kWidth = 640;
    // The row of squares is enough.
    constexpr std::size_t kHeight = 48;
    const std::string bytes = decoded(movie, {"-map", "0:v", "-fps_mode", "passthrough", "-vf", "crop=640:48:0:0", "-f",
                                              "rawvideo", "-pix_fmt", "gray"});
    std::vector<int> numbers;
    for (std::size_t picture = 0; picture + kWidth * kHeight <= bytes.size(); picture += kWidth * kHeight) {
        int number = 0;
        for (std::size_t i = 0; i < 16; ++i)
            number |= (static_cast<unsigned char>(bytes[picture + kWidth * 24 + 24 + 38 * i]) > 125) << i;
        numbers.push_back(number);
    }
    return numbers;
}

/// Samples of the first channel of a sound track, at 48 kHz.
inline std::vector<float> samplesIn(const std::filesystem::path& movie, int track)
{
    const std::string bytes = decoded(
        movie, {"-map", "0:a:" + std::to_string(track), "-af", "pan=mono|c0=c0", "-ar", "48000", "-f", "f32le"});
    std::vector<float> samples(bytes.size() / sizeof(float));
    if (!samples.empty())
        std::memcpy(samples.data(), bytes.data(), samples.size() * sizeof(float));
    return samples;
}

/// How loud a tone is in the middle of the samples, in decibels of full scale.
inline double levelOf(const std::vector<float>& samples, double hertz)
{
    // Whole seconds hold whole periods.
    constexpr std::size_t kRate = 48000;
    if (samples.size() < 2 * kRate)
        return -200;
    const std::size_t first = samples.size() / 2 - kRate / 2;
    double real = 0;
    double imaginary = 0;
    for (std::size_t i = 0; i < kRate; ++i) {
        const double angle = 2 * std::numbers::pi * hertz * static_cast<double>(i) / kRate;
        real += static_cast<double>(samples[first + i]) * std::cos(angle);
        imaginary += static_cast<double>(samples[first + i]) * std::sin(angle);
    }
    return 20 * std::log10(2 * std::hypot(real, imaginary) / kRate + 1e-10);
}

} // namespace tests
