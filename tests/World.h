// The world in which the tests run the program: an appliance of plain text, the emulated panel at
// the far end of the serial line, and a clock that moves only when the program waits or runs a
// command. The world replaces the POSIX calls of the program and has all its files: one that the
// world does not have is missing, and a test that would read one of the machine instead fails.
#pragma once

#include "Appliance.h"

#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"

#include <boost/algorithm/string/trim.hpp>

#include <chrono>
#include <functional>
#include <set>
#include <string>
#include <vector>

using Micros = std::chrono::microseconds;

struct World {
    Appliance appliance;
    bool shellWorks = true;
    bool clockWorks = true;
    bool lineTakesBytes = true;
    std::set<std::string> directories; // in place of these files
    std::set<std::string> cutFiles;    // behind whose contents reading fails

    emulator::Display display;
    emulator::Keypad keypad{[this](emulator::Key key) {
        unread += {'\xFD', static_cast<char>(emulator::traits(key).code)};
    }};
    std::string unread;      // answers that the program has not read
    unsigned long reads = 0; // of answers
    std::string lastRead;    // may be several answers, of which the first counts

    /// Looks at the panel whenever it has taken in a byte, when time has passed, and at the time
    /// that the observer asks for.
    std::function<void()> look = [] {};
    std::function<Micros()> wakeAt = [] { return Micros::max(); };
    Micros now{1'700'000'000'000'000};
    Micros commandTime{0};     // that each command takes but the configuration script
    bool hasSignalled = false; // which cuts a wait short

    // What the program has done.
    struct Deed {
        std::string what;          // a command, or how long a pause: "3000 ms"
        emulator::Display display; // what the panel showed in the meantime
    };
    std::string sent;                // bytes written,
    std::vector<std::size_t> writes; // the length of each write,
    int writesTried = 0;
    bool commandFollows = false;     // the last byte was a prefix
    int overruns = 0;                // writes of characters past a row's end
    std::vector<Deed> pauses;        // but for the one that ends each turn
    std::vector<Deed> runs;          // of the configuration script
    std::vector<std::string> events; // "clock", "run COMMAND", "start COMMAND", "open PATH", "row"

    /// Both rows as "row 0|row 1", without the blanks at their ends.
    std::string rows() const { return display.visibleRow(0) + "|" + display.visibleRow(1); }
    std::string shown() const {
        return boost::trim_right_copy(display.visibleRow(0)) + "|" +
               boost::trim_right_copy(display.visibleRow(1));
    }
    /// Lets this time pass or, if `forAnswer`, less of it if an answer comes earlier.
    void pass(Micros time, bool forAnswer = false);
    /// Lets all of this time pass, as a command does that no signal ends.
    void passWhole(Micros time);
};

/// The one world. It exists before the first static initialiser that asks for it.
World &world();
