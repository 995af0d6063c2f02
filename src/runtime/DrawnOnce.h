#pragma once

class Menu;
class MenuContext;

/// Lets a screen draw itself whole once per visit, although it is asked to draw on every turn: a
/// redraw keeps the line busy for 180 ms.
class DrawnOnce {
  public:
    explicit DrawnOnce(Menu *owner) : screen(owner) {}

    /// True when the screen has to be drawn; from then on false until one of the calls below.
    [[nodiscard]] bool isDue();
    /// The screen stays, but something else has been shown over it.
    void drawAgain() { drawn = false; }
    /// Leaves the screen for `next`. The screen will be drawn whole when it is visited again.
    void leaveFor(MenuContext *context, Menu *next);

  private:
    Menu *screen;
    bool drawn = false;
};
