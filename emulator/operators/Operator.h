#pragma once

#include "emulator/base/Clock.h"

#include <optional>

namespace emulator {

/// What a person at the panel may do.
enum class Use {
    operate, ///< they press the keys
    watch,   ///< somebody else does
};

/// Whoever uses the panel or looks at it: a journey, a person at a terminal or in a browser, or a
/// recorder.
///
/// Each has been handed the display and the keypad. The emulator asks it to look whenever the panel
/// has taken in a byte and whenever anything else has happened.
class Operator {
  public:
    Operator() = default;
    Operator(const Operator &) = delete;
    Operator &operator=(const Operator &) = delete;
    virtual ~Operator() = default;

    /// Looks at the panel and acts. Returns the emulator's exit status when all is over. Throws
    /// std::runtime_error with what to tell the person who started the emulator.
    virtual std::optional<int> look(TimePoint now) = 0;
    /// When to look again even if nothing happens, if ever.
    [[nodiscard]] virtual std::optional<TimePoint> wakeAt() const { return std::nullopt; }

    /// The line has carried this byte to the panel.
    virtual void carried(unsigned char /*byte*/) {}
    /// Nobody could act for this time, because the emulator was stopped.
    virtual void excuse(Clock::duration /*stopped*/) {}
};

} // namespace emulator
