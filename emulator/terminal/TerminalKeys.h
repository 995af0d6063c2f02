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
/// means nothing, and one that is not continued is forgotten, so that nothing waits for its end.
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
    void takeByte(char byte, std::vector<Event> &events);
    void takeCharacter(char byte, std::vector<Event> &events);
    void finishSequence(std::vector<Event> &events);

    std::string sequence; // the part that has come, beginning with ESC
    TimePoint lastByte;
};

} // namespace emulator
