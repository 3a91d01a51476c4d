/// The role of whoever knows how large words come out on the screen, so that a layout can make room for them. Main queue.
#pragma once

#include <string_view>

namespace platform {

struct TextStyle {
    double fontSize = 17; ///< points
    bool emphasized = false;
};

class TextMeasuring {
public:
    virtual ~TextMeasuring() = default;
    /// Of the longest line as it is, without wrapping. Points.
    virtual double widthOf(std::string_view text, const TextStyle& style) const = 0;
    /// Of the lines that `text` takes, wrapped to `width`, but of no more than `mostLines` of them; 0 means any number.
    /// What is empty has no height.
    virtual double heightOf(std::string_view text, const TextStyle& style, double width, int mostLines) const = 0;
};

/// Guesses from the number of letters: where nobody has fonts.
class EstimatedText final : public TextMeasuring {
public:
    double widthOf(std::string_view text, const TextStyle& style) const override;
    double heightOf(std::string_view text, const TextStyle& style, double width, int mostLines) const override;
};

} // namespace platform
