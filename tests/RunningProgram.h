// What most tests need: a fresh process for the program, and an operator who acts turn by turn.
#pragma once

#include "World.h"

#include "runtime/MainLoop.h"
#include "status/MainMenu.h"

#include <gtest/gtest.h>

#include <functional>

/// Runs a check in a process of its own, with a program that has just been started. Returns whether
/// it succeeded; a failure is printed there.
[[nodiscard]] bool holdsInFreshProgram(const std::function<void()> &check);

/// Defines a test of a program that has just been started; its body follows.
#define FRESH_TEST(suite, name)                                                                    \
    namespace {                                                                                    \
    struct Check##suite##name {                                                                    \
        static void run();                                                                         \
    };                                                                                             \
    }                                                                                              \
    TEST(suite, name) {                                                                            \
        EXPECT_TRUE(holdsInFreshProgram(Check##suite##name::run)) << "see above";                  \
    }                                                                                              \
    void Check##suite##name::run()

/// An appliance with one port, for tests that count pages.
void standardAppliance();

class RunningProgram {
  public:
    /// Starts the program on the world as it is now.
    RunningProgram() : loop(new MainLoop(MainMenu::instance, MainMenu::requestRefresh)) {}

    /// One turn without a key, with one, or in which the panel sends just these bytes.
    void poll() { loop->turn(); }
    void poll(emulator::Key key) {
        world().keypad.press(key);
        loop->turn();
        world().keypad.release();
    }
    void answer(const std::string &bytes) {
        world().unread += bytes;
        loop->turn();
    }
    /// Holds the key, and releases it without letting time pass, as a garbled answer does.
    void hold(emulator::Key key, int polls) {
        for (int k = 0; k < polls; ++k)
            poll(key);
        answer("?");
    }
    void press(emulator::Key key) { hold(key, 1); }
    /// Turns without a key.
    void wait(std::chrono::seconds time) {
        for (const Micros end = world().now + time; world().now < end;)
            poll();
    }

  private:
    MainLoop *loop; // as the program's, it never ends
};
