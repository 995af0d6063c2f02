#pragma once

namespace emulator {

/// Restores the terminal if the program crashes while this object exists. It has to be created
/// before anything changes the terminal, and there can be only one at a time.
class TerminalRescue {
  public:
    /// Throws std::runtime_error if the kind of terminal is not known.
    TerminalRescue();
    TerminalRescue(const TerminalRescue &) = delete;
    TerminalRescue &operator=(const TerminalRescue &) = delete;
    ~TerminalRescue();
};

} // namespace emulator
