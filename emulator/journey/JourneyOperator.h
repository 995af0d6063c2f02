#pragma once

#include "emulator/journey/JourneyPlayer.h"
#include "emulator/journey/LiveSurroundings.h"
#include "emulator/operators/Operator.h"

namespace emulator {

/// A journey as the panel's operator, beside a program that runs in real time.
class JourneyOperator : public Operator {
  public:
    JourneyOperator(Loop &loop, Journey journey, JourneyPlayer::Panel panel, std::ostream &output,
                    Clock::duration limit, std::optional<std::filesystem::path> pictures)
        : surroundings(loop),
          player(std::move(journey), panel, surroundings, output, limit, std::move(pictures)) {}

    /// Sets the command through which the appliance is reached, and its process.
    void setCommand(const std::string &program, int pid) { surroundings.setCommand(program, pid); }

    std::optional<int> look(TimePoint now) override {
        return player.advance(now) ? std::optional<int>(EXIT_SUCCESS) : std::nullopt;
    }
    [[nodiscard]] std::optional<TimePoint> wakeAt() const override { return player.wakeAt(); }
    void excuse(Clock::duration stopped) override { player.excuse(stopped); }

  private:
    LiveSurroundings surroundings;
    JourneyPlayer player;
};

} // namespace emulator
