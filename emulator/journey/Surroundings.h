#pragma once

#include "emulator/base/Clock.h"
#include "emulator/journey/Steps.h"

#include <optional>
#include <string>

namespace emulator {

/// What a journey uses besides the panel: a shell, the appliance, and in a test the program.
class Surroundings {
  public:
    Surroundings() = default;
    Surroundings(const Surroundings &) = delete;
    Surroundings &operator=(const Surroundings &) = delete;
    virtual ~Surroundings() = default;

    /// Starts a command in the shell, or throws if that fails.
    virtual void start(const step::Run &run) = 0;
    /// Starts a change or a check at the appliance, or throws if that fails.
    virtual void start(const step::Appliance &appliance) = 0;
    /// The exit status of what was begun last, 128 + signal if a signal ended it; nothing while
    /// it is still at work. Throws std::runtime_error with what is wrong in a test.
    virtual std::optional<int> status() = 0;

    /// Begins what only a test can do. Returns what is wrong, or "" when all is well.
    virtual std::string act(const TestAction &action) = 0;
};

} // namespace emulator
