#pragma once

#include "emulator/base/FileDescriptor.h"
#include "emulator/base/Loop.h"

#include <deque>
#include <map>
#include <memory>
#include <string>

namespace emulator {

/// What a command prints while its output cannot be shown: its last lines, for when it has ended.
///
/// A program that runs for a long time repeats the same complaint again and again. Such lines are
/// left out, so that the last lines of interest can be found.
class CommandOutput {
  public:
    explicit CommandOutput(Loop &itsLoop) : loop(itsLoop) {}

    /// Opens a pipe and returns the end that the command is to write to. What an earlier command
    /// has printed is forgotten.
    FileDescriptor open();
    /// The last lines that came only once.
    [[nodiscard]] std::string lastWords();

  private:
    void read();
    void takeLine();

    Loop &loop;
    FileDescriptor pipe;
    std::unique_ptr<Readable> arrivals;
    std::string line; // the one that has not ended
    std::deque<std::string> lines;
    std::map<std::string, int> timesSeen;
};

} // namespace emulator
