// The language of journeys, as a table: the row of a step determines its syntax, its
// explanation, and its place in every list.
#pragma once

#include "emulator/journey/Steps.h"

#include <string>
#include <string_view>

namespace emulator {

constexpr double shortestLimit = 0.001; ///< seconds that a step may wait for the panel
constexpr double longestLimit = 86'400; ///< a day

/// Where a journey is to be played.
enum class Stage {
    panel, ///< on an emulated panel, beside a program that runs in real time
    test,  ///< in a test, where the program's calls lead into a world of virtual time
};

/// A step, or what stands for several: a walk, together with the sights behind it, and a choice.
using ParsedStep = std::variant<Action, step::Walk, step::Choose>;

/// Reads what one line says. Throws std::invalid_argument with what is wrong.
ParsedStep parseStep(std::string_view line, Stage stage);

/// The usage of each step and what it does, for `--help`: of those that can be played anywhere or,
/// for Stage::test, of those that only a test adds.
std::string stepsHelp(Stage stage);

} // namespace emulator
