#pragma once

class LcdPanel;
class MenuContext;

/// The program's spine: one key, one drawing, one short sleep, for ever.
class MainLoop {
  public:
    /// Installs the `SIGUSR1` handler and makes the status pages the current screen.
    MainLoop();

    /// One turn: waits at most 500 ms for a key, hands it to the current screen, lets the screen
    /// that is current then draw, and sleeps 100 ms. A signal cuts either wait short.
    void turn();

  private:
    LcdPanel *panel;
    MenuContext *context;
};
