#pragma once

class Menu;

/// Knows which screen is current and forwards drawing and keys to it. Does not own the screens.
class MenuContext {
  public:
    explicit MenuContext(Menu *first);

    /// Makes `next` current and does nothing else: the screen is neither told nor drawn here.
    void setMenu(Menu *next);

    void display();
    void onUp();
    void onDown();
    void onEscape();
    void onEnter();

  private:
    Menu *current;
};
