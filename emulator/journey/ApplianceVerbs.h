// A table of what a journey can change or check at the appliance. The box does it while the program
// runs in real time, and the tests' appliance does it in virtual time. Both know the same verbs,
// and a wrong one is refused before anything starts.
#pragma once

#include <string>
#include <vector>

namespace emulator {

/// Throws std::invalid_argument with what is wrong if the appliance does not know these words.
void checkVerb(const std::vector<std::string> &words);

/// Each verb's usage and what it does, for `--help`.
std::string verbsHelp();

} // namespace emulator
