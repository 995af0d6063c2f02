#pragma once

#include "runtime/KeyCode.h"
#include "runtime/String.h"

#include <cstdint>
#include <string>

/// The front panel on its serial line: two rows of 40 columns, of which 16 are visible, and four
/// keys. The one object opens and configures the line and lives until the process ends.
///
/// The line is never waited for when writing: what cannot be written is lost, silently.
class LcdPanel {
  public:
    /// The one panel. The first call opens and configures the line and clears the display; it ends
    /// the process with status 150 when the line cannot be configured.
    static LcdPanel *instance();

    LcdPanel(const LcdPanel &) = delete;
    LcdPanel &operator=(const LcdPanel &) = delete;
    ~LcdPanel();

    /// Sends the prefix and one command byte. -1 when the prefix could not be written (the command
    /// is then held back), else what writing the command byte gave.
    int sendCommand(std::uint8_t command);
    void clear();
    void home();
    /// Moves the cursor. Columns above 39 count as 39; rows other than 0 and 1 are ignored.
    void setCursor(int row, int column);
    void cursorLeft();
    void cursorRight();
    void cursorBlinkOn();
    void cursorOff();

    /// Clears the display and writes the first two lines of `text`, each padded or cut to 16
    /// columns. The second line, whole, becomes the marquee. Returns by how many characters the
    /// second line is too long for its row, 0 when it fits.
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
    void countKey(KeyCode key);
    /// True on the second to the fifth consecutive poll that reported `key`.
    bool isHeldShort(KeyCode key) const;
    /// True from the sixth consecutive poll on.
    bool isHeldLong(KeyCode key) const;

  private:
    LcdPanel();

    void configureLine();
    void send(const char *bytes, std::size_t length);
    void drawMarquee();
    std::int32_t lastMarqueeOffset() const;
    std::uint32_t pollsHeld(KeyCode key) const;

    int fd;
    std::int32_t commandPrefix;
    std::uint32_t upHeld = 0; // these four: consecutive polls, at most one of them not 0
    std::uint32_t downHeld = 0;
    std::uint32_t escapeHeld = 0;
    std::uint32_t enterHeld = 0;
    std::string marqueeText;
    std::int32_t marqueeOffset = 0;

    static LcdPanel *theInstance;
};

/// True from the second consecutive poll that reported `key` on: a handler that does nothing then
/// acts once per press.
bool isHeld(const LcdPanel *panel, KeyCode key);
