// What a journey can have happen at the appliance, or look up there, as a table. The box does it
// beside a program that runs in real time, the tests' appliance in virtual time; both know the same
// verbs, and a wrong one is refused before anything starts.
#pragma once

#include <string>
#include <vector>

namespace emulator {

/// Throws std::invalid_argument with what is wrong when the appliance does not know these words.
void checkVerb(const std::vector<std::string> &words);

/// Each verb's usage and what it does, for `--help`.
std::string verbsHelp();

} // namespace emulator
