#pragma once

#include "emulator/panel/Display.h"

#include <array>
#include <filesystem>
#include <optional>
#include <string>

namespace emulator {

/// What an operator sees of the display at one moment. The same display gives the same bytes.
class Picture {
  public:
    using Rows = std::array<std::string, Display::rowCount>;

    explicit Picture(const Display &display);
    /// A picture of two rows of text, padded or cut to 16 columns, without a cursor.
    explicit Picture(const Rows &itsRows);

    /// A frame of four lines. A blinking cursor is marked at its column in the border next to its
    /// row; bytes that are not printable ASCII show as question marks.
    [[nodiscard]] std::string text() const;
    /// An SVG file of the display's dots.
    [[nodiscard]] std::string svg() const;
    /// Writes the SVG file to `path`. Throws std::runtime_error if that fails.
    void write(const std::filesystem::path &path) const;

  private:
    Rows rows;
    std::optional<Display::Place> cursor; // if one is seen
};

} // namespace emulator
