#pragma once

class LcdPanel;

/// What stands in column 0 of a row of a choice or a list.
constexpr char rowMarker(bool selected) {
    return selected ? '>' : ' ';
}

/// Marks `row`, 0 or 1, as the selected one and the other row as not: two short writes where a
/// whole screen would keep the line busy for 180 ms.
void drawMarkers(LcdPanel *panel, int row);
