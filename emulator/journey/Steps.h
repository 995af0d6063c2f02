// The steps of a journey: one type for each kind of step, with the fields of that kind. StepTable
// contains their syntax, and JourneyPlayer what they do.
#pragma once

#include "emulator/base/Clock.h"
#include "emulator/journey/Sight.h"
#include "emulator/panel/Key.h"

#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace emulator {

/// A key that is pressed until it has answered `polls` key requests, and then let go.
struct Stroke {
    Key key;
    int polls;
};

namespace step {

constexpr int mostTapsUntil = 100; // if the journey does not say how many

/// Presses a key for one poll, `count` times; with `until`, at most that often and only until the
/// panel shows it.
struct Tap {
    Key key;
    int count;
    std::optional<Sight> until;
};

struct Keys {
    std::vector<Stroke> strokes;
};

/// Presses a key, and leaves it down once it has answered `polls` key requests.
struct Hold {
    Key key;
    int polls;
};

struct Release {};

struct Wait {
    Clock::duration time;
};

struct Expect {
    Sight sight;
};

struct ExpectCursor {
    Display::Place place;
    bool blinking;
};

/// The character that the cursor is on.
struct ExpectLetter {
    char letter;
};

/// Before each sight that is listed behind this step, KEY is tapped or, in a hold, held for one
/// poll more. Of a walk through letters, each is tapped for and expected at the cursor.
struct Walk {
    Key key;
    bool isHold;
    std::string letters;
};

/// Taps Down until this entry of a list is chosen, and then Enter.
struct Choose {
    std::string entry;
};

struct TakePicture {
    std::string name;
};

struct Say {
    std::string text;
};

struct Limit {
    Clock::duration time;
};

/// A command for the shell.
struct Run {
    std::string command;
};

/// A change or a check at the appliance: a verb and its arguments.
struct Appliance {
    std::vector<std::string> words;
};

// The following steps need a program in virtual time.

/// A fresh appliance, and a program that starts at the next step which is not about the appliance.
struct Scene {
    std::string title;
};

/// From here on this command line of the program prints this.
struct Prints {
    std::string command;
    std::string output;
};

/// The program reads these bytes in place of the panel's next answer.
struct Answer {
    std::string bytes;
};

/// Apart from key requests, just these bytes have been sent since the last step that pressed a key.
struct ExpectSent {
    std::string bytes;
};

/// The next pause in which no key was read, and what the panel showed in the meantime.
struct ExpectPause {
    Clock::duration time;
    Sight sight;
};

/// The next run of the configuration script, and what the panel showed in the meantime.
struct ExpectRun {
    std::string command;
    Sight sight;
};

} // namespace step

using TestAction = std::variant<step::Scene, step::Prints, step::Answer, step::ExpectSent,
                                step::ExpectPause, step::ExpectRun>;

using Action = std::variant<step::Tap, step::Keys, step::Hold, step::Release, step::Wait,
                            step::Expect, step::ExpectCursor, step::ExpectLetter, step::TakePicture,
                            step::Say, step::Limit, step::Run, step::Appliance, TestAction>;

struct Step {
    int line;          ///< of the journey's text, from 1
    std::string text;  ///< of that line, with the values of the scene's table in it
    std::string scene; ///< its title, with these values, too
    Action action;
};

} // namespace emulator
