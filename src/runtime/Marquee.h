#pragma once

#include <cstdint>
#include <string>

/// A text that scrolls round and round through a row that is too short for it: the text, a gap of
/// three blanks, and the text again.
class Marquee {
  public:
    /// Begins again, with the first character of this text.
    void start(const std::string &text);
    /// Replaces the text and keeps the place that it has been scrolled to.
    void setText(const std::string &text) { marqueeText = text; }

    void stepForward();
    void stepBackward();

    /// What a row of `width` characters shows now. Less when a short text and its repetition end
    /// within the row.
    [[nodiscard]] std::string view(std::size_t width) const;

  private:
    [[nodiscard]] std::int32_t lastOffset() const;

    std::string marqueeText;
    std::int32_t marqueeOffset = 0; ///< of the first visible character
};
