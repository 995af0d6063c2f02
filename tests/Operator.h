// What most tests need to meet the program: a fresh process, and an operator who goes turn by turn.
#pragma once

#include "World.h"

#include "runtime/MainLoop.h"
#include "status/MainMenu.h"

#include <gtest/gtest.h>

#include <functional>

/// Runs a check in a process of its own, so that it meets a program that has just been started.
/// Returns whether it held; a failure is printed there.
[[nodiscard]] bool holdsInFreshProgram(const std::function<void()> &check);

/// A test that meets a program which has just been started, whatever has run before it.
class FreshProgram : public testing::Test {
  protected:
    virtual void check() = 0;

  private:
    void TestBody() final {
        EXPECT_TRUE(holdsInFreshProgram([this] { check(); })) << "see above";
    }
};

/// Defines such a test; its body follows.
#define FRESH_TEST(suite, name)                                                                    \
    class suite##name : public FreshProgram {                                                      \
        void check() override;                                                                     \
    };                                                                                             \
    const auto *const suite##name##Registered =                                                    \
        testing::RegisterTest(#suite, #name, nullptr, nullptr, __FILE__, __LINE__,                 \
                              []() -> FreshProgram * { return new suite##name; });                 \
    void suite##name::check()

/// An appliance with one port, for tests that count pages.
void standardAppliance();

class Operator {
  public:
    /// Starts the program on the world as it is now.
    Operator() : loop(new MainLoop(MainMenu::instance, MainMenu::requestRefresh)) {}

    void poll(); ///< one turn without a key
    void poll(emulator::Key key);
    void answer(const std::string &bytes);        ///< one turn in which the panel sends just these
    void hold(emulator::Key key, int polls);      ///< and then release it
    void press(emulator::Key key, int times = 1); ///< each as short as the keypad can tell
    void wait(double seconds);                    ///< turns without a key

    static std::string sees() { return world().shown(); }

  private:
    MainLoop *loop; // as the program's, it never ends
};
