#pragma once

#include <cstdint>

class LcdPanel;

/// The two rows of the panel as a window on a list, with a marker on the selected row. The marker
/// moves within the window first; the window scrolls when the marker is at its edge. There is no
/// way round from one end of the list to the other.
class ListWindow {
  public:
    explicit ListWindow(LcdPanel *thePanel) : panel(thePanel) {}

    /// Select the entry above or below the selected one, if there is one. The marker is moved on
    /// the panel by this call; true means that the rows show other entries now and the caller has
    /// to draw them.
    [[nodiscard]] bool up();
    [[nodiscard]] bool down(std::int32_t listLength);
    void selectFirst();

    /// Position in the list, from 0.
    [[nodiscard]] std::int32_t selected() const { return top + cursorRow; }
    [[nodiscard]] std::int32_t entryOn(int row) const { return top + row; }
    /// '>' on the selected row, a blank on the other.
    [[nodiscard]] char marker(int row) const { return row == cursorRow ? '>' : ' '; }

    [[nodiscard]] bool hasEntriesAbove() const { return top > 0; }
    [[nodiscard]] bool hasEntriesBelow(std::int32_t listLength) const;

  private:
    void moveMarkerTo(int row);

    LcdPanel *panel;
    std::int32_t top = 0; ///< the entry on row 0
    int cursorRow = 0;
};
