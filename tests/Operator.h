// An operator at the rack, in virtual time: presses keys, waits, and reads the two rows.
#pragma once

#include "World.h"

#include "runtime/KeyCode.h"
#include "runtime/MainLoop.h"
#include "status/MainMenu.h"

#include <gtest/gtest.h>

/// The appliance that most tests start from: a hardware model with one configured port.
void standardAppliance(World &appliance);

class Operator {
  public:
    /// Starts the program on the world as it is now.
    Operator() : loop(running = new MainLoop(MainMenu::instance, MainMenu::requestRefresh)) {}

    void poll(KeyCode key = keyNone);       ///< one turn, with this key down or none
    void hold(KeyCode key, int polls);      ///< that many turns with the key down, then release
    void press(KeyCode key, int times = 1); ///< as short as the keypad can tell, then released
    /// Presses u, d, e (Enter) and x (Escape) in order; a number holds the key before it so long.
    void keys(const std::string &sequence);
    void answer(const std::string &bytes);      ///< one turn in which the panel sends just these
    void wait(double seconds);                  ///< turns without a key
    void waitForPage(const std::string &title); ///< until row 0 begins with this; fails in the end

    static std::string sees();
    /// Where the cursor blinks, as "row,column", or "off".
    static std::string cursor();

  private:
    static MainLoop *running; // the program never ends, and neither does its loop
    MainLoop *loop;
};

/// Runs a check in a process of its own, so that it meets a program that has just been started.
void inFreshProgram(const std::function<void()> &check);
