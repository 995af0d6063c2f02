#include "runtime/drawMarkers.h"

#include "runtime/LcdPanel.h"

void drawMarkers(LcdPanel *panel, int row) {
    panel->setCursor(0, 0);
    panel->writeAtCursor(row == 0 ? ">" : " ", 1);
    panel->setCursor(1, 0);
    panel->writeAtCursor(row == 1 ? ">" : " ", 1);
}
