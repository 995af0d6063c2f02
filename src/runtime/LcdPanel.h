#pragma once

#include "runtime/HeldKeys.h"
#include "runtime/KeyCode.h"
#include "runtime/Marquee.h"
#include "runtime/SerialLine.h"
#include "runtime/String.h"

#include <cstdint>
#include <string>

/// The front panel: a display, whose lower row can scroll, and four keys. The one object opens the
/// serial line and lives until the process ends.
class LcdPanel {
  public:
    static constexpr int rows = 2;
    static constexpr int columns = 40;        ///< of a row, as the cursor counts
    static constexpr int visibleColumns = 16; ///< the first of them

    /// The one panel. The first call opens and configures the line and clears the display; it ends
    /// the process with status 150 when the line cannot be configured.
    static LcdPanel *instance() {
        static auto *const only = new LcdPanel;
        return only;
    }

    /// Sends the prefix and one command byte. -1 when the prefix could not be written (the command
    /// is then held back), else what writing the command byte gave.
    int sendCommand(std::uint8_t command);
    void clear();
    void home();
    /// Moves the cursor. Columns above 39 count as 39; rows other than 0 and 1 are ignored.
    /// Negative columns are not limited: a host name may be too long for the row, but no screen
    /// counts below its first column.
    void setCursor(int row, int column);
    void cursorLeft();
    void cursorRight();
    void cursorBlinkOn();
    void cursorOff();

    /// Clears the display and writes the first two lines of `text`, each padded or cut to the
    /// visible columns. The second line, whole, becomes the marquee. Returns by how many characters
    /// the second line is too long for its row, 0 when it fits.
    int showText(QLX::String<char> text);
    /// Writes at the cursor and leaves the cursor on the last character written, not behind it, so
    /// that a blinking cursor marks that character.
    void writeAtCursor(const char *bytes, int length);
    /// Replaces the marquee's text and keeps the place that it has been scrolled to.
    void setMarqueeText(const std::string &text);
    void resetMarquee();
    /// Moves the text of row 1 by one character, round and round, and redraws the row.
    void scrollMarqueeForward();
    void scrollMarqueeBackward();

    /// Asks which key is down: waits for at most 500 ms, counts the answer and returns the key. A
    /// short or garbled answer counts as no key; a backlog of answers yields one key.
    KeyCode pollKey();
    /// Counts one poll that reported `key`, without asking the panel.
    void countKey(KeyCode key) { heldKeys.count(key); }
    /// True on the second to the fifth consecutive poll that reported `key`.
    [[nodiscard]] bool isHeldShort(KeyCode key) const { return heldKeys.isHeldShort(key); }
    /// True from the sixth consecutive poll on.
    [[nodiscard]] bool isHeldLong(KeyCode key) const { return heldKeys.isHeldLong(key); }

  private:
    LcdPanel();

    void writeRow(const std::string &text);
    void drawMarquee();

    SerialLine line;
    std::int32_t commandPrefix; ///< FE hex; as the line carries bytes, only the low one is sent
    HeldKeys heldKeys;
    Marquee marquee;
};
