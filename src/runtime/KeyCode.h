#pragma once

/// One of the panel's four keys, or none. A plain integer: it is what the main loop dispatches on.
using KeyCode = int;

constexpr KeyCode keyNone = 0;
constexpr KeyCode keyUp = 1;
constexpr KeyCode keyDown = 2;
constexpr KeyCode keyEnter = 3;
constexpr KeyCode keyEscape = 4;
