#pragma once

#include "runtime/KeyCode.h"

#include <cstdint>

/// How long each key has been down, counted in polls. A hold is short from its 2nd to its 5th poll
/// and long from its 6th: a held key rests for four polls before it may repeat.
class HeldKeys {
  public:
    /// Counts one poll that reported `key`. Any other key, and no key, ends the hold of a key.
    void count(KeyCode key);

    [[nodiscard]] bool isHeldShort(KeyCode key) const;
    [[nodiscard]] bool isHeldLong(KeyCode key) const;

  private:
    [[nodiscard]] std::uint32_t pollsHeld(KeyCode key) const;

    static constexpr std::uint32_t firstShortPoll = 2;
    static constexpr std::uint32_t lastShortPoll = 5;
    static constexpr std::uint32_t firstLongPoll = 6;

    // Consecutive polls of each key. At most one of the four is not 0, but with a counter of its
    // own no key can be taken for another.
    std::uint32_t upHeld = 0;
    std::uint32_t downHeld = 0;
    std::uint32_t escapeHeld = 0;
    std::uint32_t enterHeld = 0;
};
