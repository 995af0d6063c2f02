#include "emulator/Emulator.h"

#include "emulator/panel/Picture.h"

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <initializer_list>
#include <iostream>
#include <stdexcept>
#include <utility>

namespace emulator {

namespace {

constexpr int signalStatus = 128; // and the signal's number
// The guard needs at most three seconds to end the command or to give up.
constexpr std::chrono::seconds commandPatience{4};
constexpr std::chrono::seconds browserPatience{1};
// There is a turn at least this often. If one comes much later, the emulator has been stopped.
constexpr std::chrono::milliseconds idleTurn{500};
constexpr std::chrono::milliseconds longestTurn{1000};

// The address has a line of its own, so that other programs can read it.
void announce(const WebServer &server) {
    std::cout << server.address() << '\n' << std::flush;
    if (server.isOpenToOthers())
        std::cerr
            << "panel-emulator: other machines can open this page, too, at this machine's "
               "address;\nwhoever has the link stands at the panel, and nothing is encrypted\n";
}

std::vector<std::string> withPath(std::vector<std::string> command, const std::string &path) {
    constexpr std::string_view placeholder = "{tty}";
    for (std::string &word : command) {
        std::size_t at = 0;
        while ((at = word.find(placeholder, at)) != std::string::npos) {
            word.replace(at, placeholder.size(), path);
            at += path.size();
        }
    }
    return command;
}

// Names the signals that end programs. A higher status is more likely the program's own.
std::string described(int status) {
    std::string text = "status " + std::to_string(status);
    if (status > signalStatus && status <= signalStatus + SIGTERM)
        text += " (" + std::string(strsignal(status - signalStatus)) + ")";
    return text;
}

} // namespace

Emulator::Emulator(const Options &options, std::optional<Journey> journey)
    : loop([this] { turn(); }), line(options.fast, options.trace),
      keypad([this](Key key) { line.answer(traits(key).code); }),
      arrivals(loop, line.descriptor(), [] {}), output(loop), lastTurn(Clock::now()) {
    loop.onSignals({SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGTSTP, SIGWINCH},
                   [this](int number) { handleSignal(number); });
    setenv("PANEL_TTY", line.path().c_str(), 1);
    FileDescriptor commandOutput;
    isJourney = journey.has_value();
    const Use use = isJourney ? Use::watch : Use::operate;
    if (isJourney)
        journeyOperator = std::make_unique<JourneyOperator>(
            loop, std::move(*journey), JourneyPlayer::Panel{display, keypad}, std::cout,
            options.limit, options.pictures);
    if (options.web)
        webFront = std::make_unique<WebFront>(loop, *options.web, display, keypad, use);
    if (options.isDrawn())
        front = std::make_unique<TerminalFront>(loop, display, keypad, use);
    if (options.isDrawn() || !isJourney)
        commandOutput = output.open();
    // Everything that may fail comes first, so that an older recording is not overwritten for
    // nothing.
    if (options.record)
        startRecording(*options.record);
    // The recorder looks before anybody presses the next key.
    for (Operator *each : std::initializer_list<Operator *>{recorder.get(), webFront.get(),
                                                            journeyOperator.get(), front.get()}) {
        if (each != nullptr)
            operators.push_back(each);
    }
    command = std::make_unique<ChildProcess>(loop, withPath(options.command, line.path()),
                                             commandOutput.get());
    setenv("PANEL_COMMAND_PID", std::to_string(command->pid()).c_str(), 1);
    if (journeyOperator)
        journeyOperator->setCommand(options.command.front(), command->pid());
    if (webFront)
        announce(webFront->webServer());
}

void Emulator::startRecording(const std::string &path) {
    recording.open(path);
    recorder = std::make_unique<Recorder>(recording, display, keypad);
    if (!recording)
        throw std::runtime_error("cannot write " + path);
}

int Emulator::run() {
    std::exception_ptr failure;
    try {
        turn();
        loop.run();
    } catch (const std::runtime_error &error) {
        failure = std::current_exception();
        const std::string message = error.what();
        finish(EXIT_FAILURE, message.substr(0, message.find('\n')));
        turn();
        loop.run();
    }
    try {
        report();
    } catch (const std::runtime_error &error) {
        if (!failure)
            throw;
        std::cerr << "panel-emulator: " << error.what() << '\n';
    }
    if (failure)
        std::rethrow_exception(failure);
    return *result;
}

void Emulator::handleSignal(int number) {
    if (number == SIGWINCH) {
        if (front)
            front->resize();
    } else if (number == SIGTSTP) {
        const auto stop = [] { raise(SIGSTOP); };
        front ? front->stopWith(stop) : stop();
    } else if (!result) {
        finish(signalStatus + number, "a signal ended it (" + std::string(strsignal(number)) + ")");
    }
}

void Emulator::turn() {
    const TimePoint begin = Clock::now();
    if (begin - lastTurn > longestTurn) {
        for (Operator *each : operators)
            each->excuse(begin - lastTurn);
    }
    lastTurn = begin;
    line.collect();
    const TimePoint now = Clock::now();
    letOperatorsLook(now);
    while (const std::optional<Line::Byte> byte = line.next(now)) {
        if (display.receive(byte->value))
            keypad.request(byte->sinceAnswerRead);
        for (Operator *each : operators)
            each->carried(byte->value);
        // After each byte, so that no state of the panel is missed.
        letOperatorsLook(now);
    }
    noticeCommandsEnd();
    loop.wakeAt(nextTurn(now));
    arrivals.pause(line.descriptor() < 0);
}

TimePoint Emulator::nextTurn(TimePoint now) const {
    TimePoint wake = std::min(now + idleTurn, line.wakeAt().value_or(TimePoint::max()));
    for (Operator *each : operators)
        wake = std::min(wake, each->wakeAt().value_or(TimePoint::max()));
    return wake;
}

void Emulator::letOperatorsLook(TimePoint now) {
    for (Operator *each : operators) {
        if (result)
            return;
        if (const std::optional<int> status = each->look(now))
            finish(*status, each == journeyOperator.get() ? "the journey was played to its end"
                                                          : "the operator has quit");
    }
}

void Emulator::noticeCommandsEnd() {
    const std::optional<int> status = command->status();
    if (status && !result) {
        if (journeyOperator)
            throw std::runtime_error("the command ended with " + described(*status) +
                                     " before the journey did\nshown:\n" + Picture(display).text());
        hasCommandEndedItself = true;
        finish(*status, "the program ended with " + described(*status));
    }
    if (!result)
        return;
    dismissOperators();
    const TimePoint now = Clock::now();
    const bool isCommandOver = status || now >= patience;
    const bool isFarewellOver = !webFront || webFront->isIdle() || now >= farewell;
    if (isCommandOver && isFarewellOver)
        loop.stop();
}

void Emulator::finish(int exitStatus, const std::string &itsReason) {
    result = exitStatus;
    reason = itsReason;
    patience = Clock::now() + commandPatience;
    farewell = Clock::now() + browserPatience;
    command->end();
}

// This also gives the terminal back before anything is printed there.
void Emulator::dismissOperators() {
    if (operators.empty())
        return;
    operators.clear();
    front.reset();
    journeyOperator.reset();
    if (webFront)
        webFront->finish(reason);
    if (recorder)
        closeRecording();
}

void Emulator::closeRecording() {
    recorder->finish();
    recording.close();
    if (!recording)
        throw std::runtime_error("cannot write all of the recording");
}

void Emulator::report() {
    const std::optional<int> status = command->status();
    if (!status || command->isLeftRunning())
        std::cerr << "panel-emulator: the command cannot be ended: it is left running\n";
    if (hasCommandEndedItself)
        std::cerr << output.lastWords() << "panel-emulator: the command ended with "
                  << described(*status) << "\n";
    if (isJourney && display.unknownCommands() + display.hiddenCharacters() > 0) {
        std::cout << "unknown commands: " << display.unknownCommands()
                  << ", characters past the visible columns: " << display.hiddenCharacters()
                  << '\n';
    }
    line.finishTrace();
    if (!std::cout.flush())
        throw std::runtime_error("cannot write to standard output");
}

} // namespace emulator
