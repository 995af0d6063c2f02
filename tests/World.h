// The world that the program lives in, as the tests have it: an appliance made of plain data, a
// serial line whose far end is the emulated display, and a clock that moves only when the program
// waits. It stands in for the POSIX calls that the program makes.
#pragma once

#include "emulator/Display.h"

#include <deque>
#include <functional>
#include <map>
#include <string>
#include <vector>

struct World {
    // The appliance. A file that is not named cannot be opened; a port's address may be empty.
    std::map<std::string, std::string> files;
    std::map<std::string, std::string> portAddresses;
    std::map<std::string, std::string> portMethods;
    std::string hostname = "monitor\n";
    std::string scriptOutput = "0\n";
    std::map<std::string, std::string> outputs; // what these command lines print, whatever the rest
    bool shellWorks = true;
    bool clockWorks = true;
    bool lineTakesBytes = true;

    // The line and the clock. Each poll of the panel takes the next answer; "" is silence.
    std::deque<std::string> answers;
    std::function<void()> duringPoll, duringPause, duringCommand; // each runs once, then is cleared
    std::function<void(const std::string &)> onText; // before each write of characters, every time
    long long microseconds = 1'700'000'000'000'000;

    // What the program has done.
    emulator::Display display;
    std::string sent; // bytes written, and
    int writesTried = 0;
    std::vector<std::size_t> writes;  // the length of each write
    std::vector<std::string> events;  // "clock", "run COMMAND", "start COMMAND", "open PATH", "row"
    std::vector<std::string> pauses;  // "3 s ROWS": how long and over which screen; not the loop's
    std::vector<std::string> scripts; // "COMMAND behind ROWS": the configuration script's runs
    bool commandFollows = false;      // the last byte was a prefix
    std::vector<std::string> settings; // the line's, made before `main`

    /// Both rows without the blanks at their ends, as "row 0|row 1".
    std::string shown() const;
    std::string run(const std::string &command);
    std::vector<std::string> commands(const std::string &beginning) const;
};

/// The one world. It exists before the first static initialiser that asks for it.
World &world();

inline const std::string applyScript = "/opt/kestrova/scripts/ezio/apply.py ";
