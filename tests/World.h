// The world that the program lives in, as the tests have it: an appliance of plain text, the
// emulated panel at the far end of the serial line, and a clock that moves only when the program
// waits or has a command run. It stands in for the POSIX calls that the program makes, and owns
// every path: what it does not know is a test's failure, never the machine's own.
#pragma once

#include "Appliance.h"

#include "emulator/Display.h"
#include "emulator/Keypad.h"

#include <chrono>
#include <string>
#include <vector>

using Micros = std::chrono::microseconds;

/// Somebody who looks at the panel whenever it has taken in a byte or time has passed, and when he
/// wants to.
class Onlooker {
  public:
    Onlooker() = default;
    Onlooker(const Onlooker &) = delete;
    Onlooker &operator=(const Onlooker &) = delete;
    virtual ~Onlooker() = default;

    virtual void look() = 0;
    virtual Micros wakeAt() const = 0;
};

struct World {
    Appliance appliance;
    bool shellWorks = true;
    bool clockWorks = true;
    bool lineTakesBytes = true;

    emulator::Display display;
    emulator::Keypad keypad{[this](emulator::Key key) {
        unread += {'\xFD', static_cast<char>(emulator::traits(key).code)};
    }};
    std::string unread;      // answers that the program has not read
    unsigned long reads = 0; // of answers

    Onlooker *onlooker = nullptr;
    Micros now{1'700'000'000'000'000};
    Micros commandTime{0};     // that each command takes but the configuration script
    bool hasSignalled = false; // which cuts a wait short

    // What the program has done.
    struct Deed {
        std::string what;   // a command, or how long a pause: "3000 ms"
        std::string behind; // what the panel showed meanwhile
    };
    std::string sent;                // bytes written,
    std::vector<std::size_t> writes; // the length of each write,
    int writesTried = 0;
    bool commandFollows = false;     // the last byte was a prefix
    int overruns = 0;                // writes of characters past a row's end
    std::vector<Deed> pauses;        // but for the one that ends each turn
    std::vector<Deed> runs;          // of the configuration script
    std::vector<std::string> events; // "clock", "run COMMAND", "start COMMAND", "open PATH", "row"
    std::vector<std::string> settings; // the line's, made before `main`

    /// Both rows without the blanks at their ends, as "row 0|row 1".
    std::string shown() const;
    /// The arguments of the events that begin so.
    std::vector<std::string> commands(const std::string &beginning) const;
    /// Lets this time pass, or, if `forAnswer`, as much of it as goes by before there is one.
    void pass(Micros time, bool forAnswer = false);
};

/// The one world. It exists before the first static initialiser that asks for it.
World &world();
