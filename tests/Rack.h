// The surroundings of a journey in virtual time: the rack that contains the panel and the appliance
// with the running program. It plays journeys, and checks what has to hold on every screen whatever
// an operator does.
#pragma once

#include "RunningProgram.h"

#include "emulator/journey/JourneyPlayer.h"

#include <functional>
#include <string>

/// How a journey ended.
struct Outcome {
    bool holds;
    long long turns;
};

/// Plays a journey in virtual time, in a new process for each start of the program. What fails is
/// printed, unless `silently`. Pictures are written to `pictures` if that names a folder.
Outcome play(const emulator::Journey &journey, bool silently = false,
             const std::string &pictures = "");

/// Reads a journey from this text; throws std::invalid_argument if it is none.
emulator::Journey readJourney(const std::string &text, const std::string &name);
