#pragma once

#include "emulator/base/Clock.h"
#include "emulator/panel/Keypad.h"

#include <deque>
#include <optional>

namespace emulator {

/// The finger of a person at a terminal, which reports that a key was typed but not when it goes
/// down and comes up. One key is down at a time.
///
/// A typed key stays down as long as a finger would, and comes up when it has been answered once.
/// If the program does not ask in the meantime, the key is forgotten, as on a real panel. Keys that
/// are typed faster than the program can tell them apart wait for their turn, if it asks at all.
class Finger {
  public:
    explicit Finger(Keypad &itsKeypad) : keypad(itsKeypad) {}

    /// A key was typed.
    void tap(Key key, TimePoint now);
    /// A key goes down until the same one is held again, or any other is used.
    void hold(Key key);
    /// A key goes down until `release`.
    void press(Key key, TimePoint now);
    void release(TimePoint now);
    /// Something was typed that is not a key of the panel, which ends a hold.
    void letGo();
    /// Whatever is down comes up, whether it has been answered or not.
    void lift();

    void look(TimePoint now);
    [[nodiscard]] std::optional<TimePoint> wakeAt() const;

  private:
    enum class Manner { tap, hold, press };
    struct Down {
        Key key;
        Manner manner;
        TimePoint since;
        unsigned long answersBefore;
    };
    struct Typed {
        Key key;
        TimePoint time;
        unsigned long requestsBefore;
    };

    void putDown(Key key, Manner manner, TimePoint now);

    Keypad &keypad;
    std::optional<Down> down;
    std::deque<Typed> waiting;
};

} // namespace emulator
