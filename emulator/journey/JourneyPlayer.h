#pragma once

#include "emulator/base/Clock.h"
#include "emulator/journey/Journey.h"
#include "emulator/journey/Surroundings.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"

#include <deque>
#include <filesystem>
#include <optional>
#include <ostream>

namespace emulator {

/// Plays a journey on a display and a keypad, one step after the other. It has no clock of its own:
/// `advance` is told the time, both in the real world and in a test.
class JourneyPlayer {
  public:
    struct Panel {
        const Display &display;
        Keypad &keypad;
    };

    /// Pictures and words go to `output` as text. `limit` is how long an expectation waits, and
    /// how long the program may leave a key unread; pictures are also written as SVG files to
    /// `pictures` if that names a directory.
    JourneyPlayer(Journey journey, Panel panel, Surroundings &surroundings, std::ostream &output,
                  Clock::duration limit,
                  std::optional<std::filesystem::path> pictures = std::nullopt);

    /// Goes on as far as the panel's state allows. To be called whenever that has changed, whenever
    /// what the surroundings started has ended, and at `wakeAt`. Returns true when the journey is
    /// over. Throws std::runtime_error with the message for the operator when a step fails.
    bool advance(TimePoint time);
    [[nodiscard]] TimePoint wakeAt() const { return deadline; }
    /// The step that is being played, or will be next.
    [[nodiscard]] std::size_t position() const { return next; }
    /// Goes on from the beginning of that step, with the limit that is in force there.
    void goTo(std::size_t step);
    /// Does not count a time in which nobody could act, because the emulator was stopped.
    void excuse(Clock::duration time) { deadline += time; }

  private:
    // Each begins its step when `begins` is true, and says whether the step is over.
    bool play(const step::Tap &tap, bool begins);
    bool play(const step::Keys &sequence, bool begins);
    bool play(const step::Hold &hold, bool begins);
    bool play(const step::Release &release, bool begins);
    bool play(const step::Wait &wait, bool begins);
    bool play(const step::Expect &expect, bool begins);
    bool play(const step::ExpectCursor &cursor, bool begins);
    bool play(const step::ExpectLetter &expected, bool begins);
    bool play(const step::TakePicture &picture, bool begins);
    bool play(const step::Say &say, bool begins);
    bool play(const step::Limit &newLimit, bool begins);
    bool play(const step::Run &run, bool begins);
    bool play(const step::Appliance &appliance, bool begins);
    bool play(const TestAction &action, bool begins);

    // Why a step has not come to its end in time.
    [[nodiscard]] std::string complaint(const step::Expect &expect) const;
    [[nodiscard]] std::string complaint(const step::ExpectCursor &cursor) const;
    [[nodiscard]] std::string complaint(const step::ExpectLetter &expected) const;
    [[nodiscard]] std::string complaint(const step::Run &run) const;
    [[nodiscard]] std::string complaint(const step::Appliance &appliance) const;
    [[nodiscard]] std::string complaint(const TestAction &action) const;
    template <typename AnyOther> [[nodiscard]] std::string complaint(const AnyOther &) const {
        return unansweredKey();
    }

    void awaitAnswers();
    bool isAnswered(int polls);
    bool hasSucceeded();
    [[nodiscard]] std::string shown() const;
    void rememberSight();
    [[nodiscard]] std::string sightsBefore() const;
    [[nodiscard]] std::string unansweredKey() const;

    Journey journey;
    Panel panel;
    Surroundings &surroundings;
    std::ostream &output;
    Clock::duration limit;
    std::optional<std::filesystem::path> pictures;

    std::size_t next = 0; // step
    bool hasBegun = false;
    TimePoint now;
    TimePoint deadline; // of the step that has begun
    int tapsLeft = 0;
    std::size_t nextStroke = 0;
    unsigned long answersBefore = 0;  // answers to key requests, when the key went down
    unsigned long answersLast = 0;    // and when they were last looked at
    unsigned long requestsBefore = 0; // key requests when the step began
    unsigned long requestsSeen = 0;   // and when the panel was last looked at
    std::deque<std::string> sights;   // the last different ones
};

} // namespace emulator
