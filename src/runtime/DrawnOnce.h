#pragma once

class Menu;
class MenuContext;

/// Lets a screen draw itself completely once per visit, although it is asked to draw on every turn,
/// because a redraw keeps the line busy for 180 ms. A screen is also left through this part, so
/// that none can be left without being drawn on the next visit.
class DrawnOnce {
  public:
    explicit DrawnOnce(Menu *owner) : screen(owner) {}

    /// True on the first call, for the caller that is to draw the screen now. False from then on,
    /// until one of the calls below.
    [[nodiscard]] bool claimDrawing();
    /// The screen stays current, but something else has been shown in its place.
    void drawAgain() { drawn = false; }
    /// Makes `next` the current screen. This one will be drawn whole when it is visited again.
    void leaveFor(MenuContext *context, Menu *next);

  private:
    Menu *screen;
    bool drawn = false;
};
