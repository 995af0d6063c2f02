// A journey's surroundings in virtual time: the rack that the panel and the appliance are built
// into, with the program running there. Plays journeys, and watches that some things hold on every
// screen whatever an operator does.
#pragma once

#include "Operator.h"

#include "emulator/JourneyPlayer.h"

#include <functional>
#include <string>

/// How a journey ended.
struct Outcome {
    bool holds;
    long long turns;
};

/// Plays a journey in virtual time, in a process of its own for the program's each start. What
/// fails is printed, unless `silently`. Pictures are written to `pictures` if that names a folder.
Outcome play(const emulator::Journey &journey, bool silently = false,
             const std::string &pictures = "");

/// The journey that this text is; throws std::invalid_argument when it is none.
emulator::Journey readJourney(const std::string &text, const std::string &name);
