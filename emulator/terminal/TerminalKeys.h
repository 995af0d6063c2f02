#pragma once

#include "emulator/base/Clock.h"
#include "emulator/panel/Key.h"

#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace emulator {

/// Reads keys and the mouse from the bytes that a terminal sends. A sequence that is not known
/// means nothing, nor does a pasted text, and one that is not continued is forgotten, so that
/// nothing waits for its end.
class TerminalKeys {
  public:
    struct Tap {
        Key key;
    };
    struct Hold {
        Key key;
    };
    struct MouseDown {
        int row, column; ///< from 0
    };
    struct MouseUp {};
    struct Quit {};
    struct Other {}; ///< any other character
    using Event = std::variant<Tap, Hold, MouseDown, MouseUp, Quit, Other>;

    /// Takes bytes in, and returns what they and those before them mean.
    std::vector<Event> take(std::string_view bytes, TimePoint now);
    /// What has become clear because nothing followed. To be called at `wakeAt`.
    std::vector<Event> look(TimePoint now);
    [[nodiscard]] std::optional<TimePoint> wakeAt() const;

  private:
    [[nodiscard]] bool isEscapes() const;
    [[nodiscard]] bool isInString() const;
    void tapEscape(std::vector<Event> &events) const;
    void takeByte(char byte, std::vector<Event> &events);
    void takeSequenceByte(char byte, std::vector<Event> &events);
    void takeStringByte(char byte, std::vector<Event> &events);
    void takeCharacter(char byte, std::vector<Event> &events);
    void finishSequence(std::vector<Event> &events);

    std::string sequence;   // the part that has come, beginning with ESC; of a string, its ends
    bool isPasting = false; // a text from elsewhere, which presses no keys
    TimePoint lastByte;
};

} // namespace emulator
