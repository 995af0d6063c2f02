#pragma once

class LcdPanel;

/// Puts the ">" of a choice on `row`, 0 or 1, and a blank on the other row: two short writes where
/// a whole screen would keep the line busy for 180 ms.
void drawMarkers(LcdPanel *panel, int row);
