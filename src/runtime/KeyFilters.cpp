#include "runtime/KeyFilters.h"

#include "runtime/LcdPanel.h"

bool actsOncePerPress(const LcdPanel *panel, KeyCode key) {
    return !panel->isHeldShort(key) && !panel->isHeldLong(key);
}

bool actsRestsAndRepeats(const LcdPanel *panel, KeyCode key) {
    return !panel->isHeldShort(key);
}
