// What a key does while it is held down. A handler asks one of these first and returns when the
// answer is no; a handler that acts on every poll says why.
#pragma once

#include "runtime/KeyCode.h"

class LcdPanel;

/// True on the first poll of a press only. A key that is still down after it has changed the
/// screen is no new press there.
[[nodiscard]] bool actsOncePerPress(const LcdPanel *panel, KeyCode key);

/// True on the first poll of a press, false on the next four, and true on every later one.
[[nodiscard]] bool actsRestsAndRepeats(const LcdPanel *panel, KeyCode key);
