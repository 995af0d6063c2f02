#pragma once

#include "emulator/Options.h"
#include "emulator/base/LateFile.h"
#include "emulator/base/Loop.h"
#include "emulator/command/ChildProcess.h"
#include "emulator/command/CommandOutput.h"
#include "emulator/journey/JourneyOperator.h"
#include "emulator/journey/Recorder.h"
#include "emulator/line/Line.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"
#include "emulator/terminal/TerminalFront.h"
#include "emulator/web/WebFront.h"

#include <memory>
#include <sstream>
#include <string>
#include <vector>

namespace emulator {

/// The emulated panel at work: the line, the display, the keypad, the command that uses them, and
/// the operators.
class Emulator {
  public:
    /// Opens the line and starts the command. The journey, if any, has been read by then.
    /// Throws if the line, the terminal, the page's address, a file or a process is not available.
    Emulator(const Options &options, std::optional<Journey> journey);

    /// Runs until the journey or the command ends, the operator quits or a signal comes, and then
    /// until the command has ended. Returns the emulator's exit status. Throws std::runtime_error
    /// when the journey fails.
    int run();

  private:
    void startCommand();
    void startOver();
    void beginAnew();
    void handleSignal(int number);
    void turn();
    [[nodiscard]] TimePoint nextTurn(TimePoint now) const;
    void letOperatorsLook(TimePoint now);
    void noticeCommandsEnd();
    void finish(int exitStatus, const std::string &reason);
    void dismissOperators();
    void closeRecording();
    void report();

    Loop loop;
    Display display;
    Line line;
    std::unique_ptr<LateFile> recording;
    std::ostringstream said; // by a journey while the panel is drawn
    Keypad keypad;
    Readable arrivals; // on the line
    CommandOutput output;
    std::unique_ptr<JourneyOperator> journeyOperator;
    std::unique_ptr<TerminalFront> front;
    std::unique_ptr<WebFront> webFront;
    std::unique_ptr<Recorder> recorder;
    std::vector<Operator *> operators; // those of the above that exist, until all is over
    std::vector<std::string> words;    // the command and its arguments
    std::unique_ptr<ChildProcess> command;
    bool isOutputKept = false; // of the command
    bool isJourney = false;
    bool isStartingOver = false; // once the command has ended
    TimePoint lastTurn;
    std::optional<int> result; // the exit status, once all is over
    std::string reason;        // for it, as the page tells it
    TimePoint patience;        // until when the command's end is then waited for
    TimePoint farewell;        // until when browsers are told
    bool hasCommandEndedItself = false;
};

} // namespace emulator
