#pragma once

#include "ChildProcess.h"
#include "Clock.h"
#include "Display.h"
#include "Journey.h"
#include "Keypad.h"

#include <filesystem>
#include <memory>
#include <optional>
#include <ostream>

namespace emulator {

/// Plays a journey on a display and a keypad, one step after the other.
class JourneyPlayer {
  public:
    struct Panel {
        const Display &display;
        Keypad &keypad;
    };

    /// Pictures and words go to `output` as text. `limit` is how long an expectation waits, and
    /// how long the program may leave a key unread; pictures are also written as SVG files to
    /// `pictures` if that names a directory.
    JourneyPlayer(Journey journey, Panel panel, std::ostream &output, Clock::duration limit,
                  std::optional<std::filesystem::path> pictures = std::nullopt);

    /// Goes as far as the panel's state lets it; to be called whenever that has changed, whenever
    /// `descriptor` is readable, and at `wakeAt`. Returns true when the journey is over. Throws
    /// std::runtime_error with the message for the operator when a step fails.
    bool advance(TimePoint now);
    [[nodiscard]] TimePoint wakeAt() const { return deadline_; }
    [[nodiscard]] int descriptor() const { return shell_ ? shell_->descriptor() : -1; }

  private:
    using Step = Journey::Step;

    void begin(const Step &step, TimePoint now);
    bool isDone(const Step &step, TimePoint now);
    bool isDoneTapping(const Step &step, TimePoint now);
    bool isDoneHolding(const Step &step, TimePoint now);
    bool isDoneRunning(const Step &step);
    [[noreturn]] void fail(const Step &step, const std::string &reason) const;
    [[nodiscard]] std::string reasonOfDelay(const Step &step) const;
    void takePicture(const Step &step);

    Journey journey_;
    Panel panel_;
    std::ostream &output_;
    Clock::duration limit_;
    std::optional<std::filesystem::path> pictures_;

    std::size_t next_ = 0;
    bool begun_ = false;
    TimePoint deadline_; // of the step that has begun
    int tapsLeft_ = 0;
    unsigned long answeredBefore_ = 0;
    unsigned long answeredLast_ = 0;
    std::unique_ptr<ChildProcess> shell_;
};

} // namespace emulator
