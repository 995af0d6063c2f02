#pragma once

class LcdPanel;
class MenuContext;

/// A screen: what it draws and what the four keys do on it. One object per class, created on first
/// use through the class's own `instance()` and never destroyed, so that it keeps its cursor and
/// values between visits.
class Menu {
  public:
    /// Is called on every turn of the main loop, after the key, and so must be cheap if nothing has
    /// changed.
    virtual void display(MenuContext *context);
    virtual void onUp(MenuContext *context);
    virtual void onDown(MenuContext *context);
    virtual void onEscape(MenuContext *context);
    virtual void onEnter(MenuContext *context);

    /// Makes `next` current. It is drawn by the `display` at the end of the same turn.
    void setMenu(MenuContext *context, Menu *next);

  protected:
    Menu();
    ~Menu() = default; // runs only when a screen's constructor fails part-way

    LcdPanel *panel;
};
