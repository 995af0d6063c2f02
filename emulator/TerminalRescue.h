#pragma once

namespace emulator {

/// Gives the terminal back what it had if the program crashes while this object lives. To be
/// created before anything changes the terminal; one at a time.
class TerminalRescue {
  public:
    /// Throws std::runtime_error if the kind of terminal is not known.
    TerminalRescue();
    TerminalRescue(const TerminalRescue &) = delete;
    TerminalRescue &operator=(const TerminalRescue &) = delete;
    ~TerminalRescue();
};

} // namespace emulator
