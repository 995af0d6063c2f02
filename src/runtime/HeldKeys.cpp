#include "runtime/HeldKeys.h"

void HeldKeys::count(KeyCode key) {
    upHeld = key == keyUp ? upHeld + 1 : 0;
    downHeld = key == keyDown ? downHeld + 1 : 0;
    escapeHeld = key == keyEscape ? escapeHeld + 1 : 0;
    enterHeld = key == keyEnter ? enterHeld + 1 : 0;
}

bool HeldKeys::isHeldShort(KeyCode key) const {
    return pollsHeld(key) >= firstShortPoll && pollsHeld(key) <= lastShortPoll;
}

bool HeldKeys::isHeldLong(KeyCode key) const {
    return pollsHeld(key) >= firstLongPoll;
}

std::uint32_t HeldKeys::pollsHeld(KeyCode key) const {
    switch (key) {
    case keyUp:
        return upHeld;
    case keyDown:
        return downHeld;
    case keyEnter:
        return enterHeld;
    case keyEscape:
        return escapeHeld;
    default:
        return 0;
    }
}
