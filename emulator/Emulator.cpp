#include "emulator/Emulator.h"

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <iostream>
#include <stdexcept>
#include <utility>

namespace emulator {

namespace {

constexpr int signalStatus = 128; // and the signal's number
// The guard needs three at most to end the command, or to give up.
constexpr std::chrono::seconds commandPatience{4};
// A turn comes at least that often, and one that comes much later does because the emulator was
// stopped.
constexpr std::chrono::milliseconds idleTurn{500};
constexpr std::chrono::milliseconds longestTurn{1000};

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

// Names the signals that end programs. Beyond them a status is rather the program's own.
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
    const bool isDrawn = !journey || options.show;
    isJourney = journey.has_value();
    if (isJourney)
        journeyOperator =
            add<JourneyOperator>(loop, std::move(*journey), JourneyPlayer::Panel{display, keypad},
                                 std::cout, options.limit, options.pictures);
    if (isDrawn) {
        commandOutput = output.open();
        front = add<TerminalFront>(loop, display, keypad,
                                   journeyOperator != nullptr ? TerminalFront::Use::watch
                                                              : TerminalFront::Use::operate);
    }
    // After all that may refuse: an older recording is not given up for nothing. It looks before
    // anybody presses the next key.
    if (options.record) {
        recorder = add<Recorder>(*options.record, display, keypad);
        std::rotate(operators.begin(), operators.end() - 1, operators.end());
    }
    command = std::make_unique<ChildProcess>(loop, withPath(options.command, line.path()),
                                             commandOutput.get());
    setenv("PANEL_COMMAND_PID", std::to_string(command->pid()).c_str(), 1);
    if (journeyOperator != nullptr)
        journeyOperator->setCommand(options.command.front(), command->pid());
}

template <typename Kind, typename... Arguments> Kind *Emulator::add(Arguments &&...arguments) {
    auto added = std::make_unique<Kind>(std::forward<Arguments>(arguments)...);
    Kind *borrowed = added.get();
    operators.push_back(std::move(added));
    return borrowed;
}

int Emulator::run() {
    std::exception_ptr failure;
    try {
        turn();
        loop.run();
    } catch (const std::runtime_error &) {
        failure = std::current_exception();
        finish(EXIT_FAILURE);
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
        if (front != nullptr)
            front->resize();
    } else if (number == SIGTSTP) {
        const auto stop = [] { raise(SIGSTOP); };
        front != nullptr ? front->stopWith(stop) : stop();
    } else if (!result) {
        finish(signalStatus + number);
    }
}

void Emulator::turn() {
    const TimePoint begin = Clock::now();
    if (begin - lastTurn > longestTurn) {
        for (const auto &each : operators)
            each->excuse(begin - lastTurn);
    }
    lastTurn = begin;
    line.collect();
    const TimePoint now = Clock::now();
    letOperatorsLook(now);
    while (const std::optional<Line::Byte> byte = line.next(now)) {
        if (display.receive(byte->value))
            keypad.request(byte->sinceAnswerRead);
        for (const auto &each : operators)
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
    for (const auto &each : operators)
        wake = std::min(wake, each->wakeAt().value_or(TimePoint::max()));
    return wake;
}

void Emulator::letOperatorsLook(TimePoint now) {
    for (const auto &each : operators) {
        if (result)
            return;
        if (const std::optional<int> status = each->look(now))
            finish(*status);
    }
}

void Emulator::noticeCommandsEnd() {
    const std::optional<int> status = command->status();
    if (status && !result) {
        if (journeyOperator != nullptr)
            throw std::runtime_error("the command ended with " + described(*status) +
                                     " before the journey did\nshown:\n" + Picture(display).text());
        hasCommandEndedItself = true;
        finish(*status);
    }
    if (!result)
        return;
    dismissOperators();
    if (status || Clock::now() >= patience)
        loop.stop();
}

void Emulator::finish(int exitStatus) {
    result = exitStatus;
    patience = Clock::now() + commandPatience;
    command->end();
}

// Gives the terminal back, too, before anything is said there.
void Emulator::dismissOperators() {
    front = nullptr;
    journeyOperator = nullptr;
    const auto all = std::exchange(operators, {});
    if (recorder != nullptr)
        std::exchange(recorder, nullptr)->finish();
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
