#pragma once

#include <array>
#include <optional>
#include <string>

namespace emulator {

/// The panel's character display: a controller of the HD44780 kind with two rows of 40 positions,
/// of which the glass shows the first 16.
///
/// One address counter runs through both rows: row 0 at DDRAM addresses 00 to 27 hex, row 1 at
/// 40 to 67 hex, the end of each followed by the start of the other. A byte FE announces that the
/// next byte is a command; every other byte is a character for the cursor's position. Row 1 is
/// reached in two ways, by the controller's own command and by one of this module, which
/// stands where the controller has its custom characters. There are none of these.
class Display {
  public:
    static constexpr int rowCount = 2;
    static constexpr int visibleColumns = 16;
    static constexpr int columns = 40;

    Display();

    /// Takes one byte off the line. Returns true when it completes a key request (FE 06).
    bool receive(unsigned char byte);

    /// The 16 characters of row 0 or 1 that the glass shows, as the bytes that were received.
    [[nodiscard]] std::string visibleRow(int row) const;
    /// All 40 characters of row 0 or 1.
    [[nodiscard]] std::string wholeRow(int row) const;

    struct Place {
        int row;    ///< 0 or 1
        int column; ///< 0 to 39
    };

    [[nodiscard]] int cursorRow() const;
    [[nodiscard]] int cursorColumn() const;
    [[nodiscard]] bool cursorBlinking() const { return isBlinking; }
    /// Where the glass shows a blinking cursor, if it shows one.
    [[nodiscard]] std::optional<Place> visibleCursor() const;

    /// How often a program has opened the panel.
    [[nodiscard]] unsigned long openings() const { return functionSets / setsPerOpening; }

    /// Commands received that this panel does not know; they change nothing else.
    [[nodiscard]] unsigned long unknownCommands() const { return unknownCount; }
    /// Characters received for positions that the glass does not show.
    [[nodiscard]] unsigned long hiddenCharacters() const { return hiddenCount; }

  private:
    static constexpr unsigned long setsPerOpening = 2;

    bool execute(unsigned char command);
    void write(unsigned char character);
    void clear();

    std::array<std::string, rowCount> rows;
    int position = 0; // 0 to 79: the address counter without the gap between the rows
    bool commandFollows = false;
    bool isBlinking = false;
    unsigned long functionSets = 0;
    unsigned long unknownCount = 0;
    unsigned long hiddenCount = 0;
};

} // namespace emulator
