#pragma once

#include <functional>

class LcdPanel;
class Menu;
class MenuContext;

/// The loop that drives the program: one key, one drawing and one short sleep, for ever.
class MainLoop {
  public:
    /// Has every `SIGUSR1` call `requestRefresh`, and then makes what `firstScreen` returns the
    /// current screen: the signal may come while the first screen is still being built. Whatever
    /// `requestRefresh` does has to be safe in a signal handler at that time already.
    ///
    /// The first is a `std::function` because an `instance()` returns a pointer to its own class;
    /// the second is a plain one because a signal handler calls it.
    MainLoop(const std::function<Menu *()> &firstScreen, void (*requestRefresh)());
    MainLoop(const MainLoop &) = delete;
    MainLoop &operator=(const MainLoop &) = delete;

    /// One turn: waits at most 500 ms for a key, hands it to the current screen, lets the screen
    /// that is current then draw, and sleeps 100 ms. A signal cuts either wait short.
    void turn();

  private:
    LcdPanel *panel;
    MenuContext *context;
};
