#include "runtime/drawMarkers.h"

#include "runtime/LcdPanel.h"

void drawMarkers(LcdPanel *panel, int row) {
    for (int each = 0; each < LcdPanel::rows; ++each) {
        panel->setCursor(each, 0);
        const char marker = rowMarker(each == row);
        panel->writeAtCursor(&marker, 1);
    }
}
