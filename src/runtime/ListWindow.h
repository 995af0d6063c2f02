#pragma once

#include "runtime/drawMarkers.h"

#include <cstdint>

class LcdPanel;

/// The two rows of the panel as a window on a list, with a marker on the selected row. The marker
/// moves within the window first; the window scrolls when the marker is at its edge. The list
/// does not wrap around.
class ListWindow {
  public:
    explicit ListWindow(LcdPanel *thePanel) : panel(thePanel) {}

    /// Select the entry above or below the selected one, if there is one. The marker is moved on
    /// the panel by this call; true means that the rows show other entries now and the caller has
    /// to draw them.
    [[nodiscard]] bool up();
    [[nodiscard]] bool down(std::int32_t listLength);
    void selectFirst();
    /// Moves the marker to `row`, 0 or 1, on the panel too: the entry there is the selected one.
    void drawMarkers(int row);

    /// Position in the list, from 0.
    [[nodiscard]] std::int32_t selected() const { return top + cursorRow; }
    [[nodiscard]] std::int32_t entryOn(int row) const { return top + row; }
    [[nodiscard]] char marker(int row) const { return rowMarker(row == cursorRow); }

    [[nodiscard]] bool hasEntriesAbove() const { return top > 0; }
    [[nodiscard]] bool hasEntriesBelow(std::int32_t listLength) const;

  private:
    LcdPanel *panel;
    std::int32_t top = 0; ///< the entry on row 0
    int cursorRow = 0;
};
