#include "runtime/ListWindow.h"

#include "runtime/LcdPanel.h"

namespace {

constexpr int bottomRow = LcdPanel::rows - 1;

} // namespace

bool ListWindow::up() {
    if (cursorRow > 0) {
        drawMarkers(cursorRow - 1);
        return false;
    }
    if (!hasEntriesAbove())
        return false;
    --top;
    return true;
}

bool ListWindow::down(std::int32_t listLength) {
    if (selected() + 1 >= listLength)
        return false;
    if (cursorRow < bottomRow) {
        drawMarkers(cursorRow + 1);
        return false;
    }
    ++top;
    return true;
}

void ListWindow::selectFirst() {
    top = 0;
    cursorRow = 0;
}

bool ListWindow::hasEntriesBelow(std::int32_t listLength) const {
    return entryOn(bottomRow) + 1 < listLength;
}

void ListWindow::drawMarkers(int row) {
    ::drawMarkers(panel, row);
    cursorRow = row;
}
