#include "emulator/Emulator.h"

#include "emulator/base/complain.h"
#include "emulator/panel/Picture.h"
#include "emulator/web/qrCode.h"

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <initializer_list>
#include <iostream>
#include <set>
#include <stdexcept>
#include <unistd.h>
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

// All that would otherwise end the emulator without giving the terminal back, and those that mean
// something to it. A crash is the terminal's rescue's.
std::vector<int> handledSignals() {
    const std::set<int> others{SIGKILL, SIGSTOP, SIGCHLD, SIGCONT, SIGURG,
                               SIGTTIN, SIGTTOU, SIGPIPE, SIGSEGV, SIGBUS,
                               SIGFPE,  SIGILL,  SIGABRT, SIGSYS,  SIGTRAP};
    std::vector<int> handled;
    for (int number = 1; number <= SIGRTMAX; number++) {
        const bool isReserved = number > SIGSYS && number < SIGRTMIN; // for the C library
        if (!isReserved && others.count(number) == 0)
            handled.push_back(number);
    }
    return handled;
}

// The address has a line of its own, so that other programs can read it.
void announce(const WebServer &server) {
    const std::string watchers = server.addressForOthers(Use::watch).value_or("");
    if (!(std::cout << server.address(Use::operate) << "\nto watch only: "
                    << (watchers.empty() ? server.address(Use::watch) : watchers) << '\n'
                    << std::flush))
        throw std::runtime_error("cannot write the page's address to standard output");
    const std::optional<std::string> link = server.addressForOthers(Use::operate);
    if (!link)
        return;
    complain("other machines can open this page, too, at " +
             (link->empty() ? "this machine's address" : *link) +
             "\nwhoever has the link stands at the panel, and nothing is encrypted");
    if (!link->empty() && isatty(STDERR_FILENO) != 0)
        std::cerr << qrCode(*link);
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
      recording(options.record ? std::make_unique<LateFile>(*options.record) : nullptr),
      keypad([this](Key key) { line.answer(traits(key).code); }),
      arrivals(loop, line.descriptor(), [] {}), output(loop), lastTurn(Clock::now()) {
    loop.onSignals(handledSignals(), [this](int number) { handleSignal(number); });
    setenv("PANEL_TTY", line.path().c_str(), 1);
    isJourney = journey.has_value();
    const Use use = isJourney ? Use::watch : Use::operate;
    if (isJourney)
        journeyOperator = std::make_unique<JourneyOperator>(
            loop, std::move(*journey), JourneyPlayer::Panel{display, keypad},
            options.isDrawn() ? said : std::cout, options.limit, options.pictures);
    if (options.web)
        webFront = std::make_unique<WebFront>(
            loop, *options.web, display, keypad, use,
            isJourney || options.record ? std::function<void()>() : [this] { startOver(); });
    if (options.isDrawn())
        front = std::make_unique<TerminalFront>(loop, display, keypad, use);
    isOutputKept = options.isDrawn() || !isJourney;
    if (recording)
        recorder = std::make_unique<Recorder>(*recording, display, keypad);
    if (webFront)
        announce(webFront->webServer());
    // The recorder looks before anybody presses the next key.
    for (Operator *each : std::initializer_list<Operator *>{recorder.get(), webFront.get(),
                                                            journeyOperator.get(), front.get()}) {
        if (each != nullptr)
            operators.push_back(each);
    }
    words = withPath(options.command, line.path());
    startCommand();
    if (journeyOperator)
        journeyOperator->setCommand(options.command.front(), command->pid());
}

void Emulator::startCommand() {
    const FileDescriptor printed = isOutputKept ? output.open() : FileDescriptor();
    command = std::make_unique<ChildProcess>(loop, words, printed.get());
    setenv("PANEL_COMMAND_PID", std::to_string(command->pid()).c_str(), 1);
}

void Emulator::startOver() {
    isStartingOver = true;
    command->end();
}

// The display is blank until the new program draws on it.
void Emulator::beginAnew() {
    isStartingOver = false;
    line.clear();
    display = Display();
    keypad.switchOn();
    webFront->beginAnew();
    startCommand();
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
        complain(error.what());
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
    } else if (number == SIGUSR1) {
        // A reload that is meant for the program, and sent by its name, often meets its emulator,
        // in whose command line that name stands, too.
        const std::string word = "SIGUSR1 is for the program, not for its emulator: ignored";
        front ? front->tell(word) : complain(word);
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
    if (status && !result && isStartingOver) {
        if (!command->isLeftRunning())
            return beginAnew();
        finish(EXIT_FAILURE, "the program could not be ended to start over");
    }
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
    recording->finish("the recording");
}

void Emulator::report() {
    const std::optional<int> status = command->status();
    if (!status || command->isLeftRunning())
        complain("the command cannot be ended: it is left running");
    if (hasCommandEndedItself) {
        std::cerr << masked(output.lastWords());
        complain("the command ended with " + described(*status));
    }
    if (isJourney && display.unknownCommands() + display.hiddenCharacters() > 0) {
        std::cout << "unknown commands: " << display.unknownCommands()
                  << ", characters past the visible columns: " << display.hiddenCharacters()
                  << '\n';
    }
    line.finishTrace();
    std::cout << said.str();
    if (!std::cout.flush())
        throw std::runtime_error("cannot write to standard output");
}

} // namespace emulator
