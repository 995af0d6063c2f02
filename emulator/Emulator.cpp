#include "Emulator.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/signalfd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <ctime>
#include <iostream>
#include <stdexcept>
#include <system_error>

namespace emulator {

namespace {

constexpr std::size_t tailBytes = 4096;
constexpr int signalStatus = 128;

FileDescriptor openSignals() {
    sigset_t ends;
    sigemptyset(&ends);
    for (const int signal : {SIGHUP, SIGINT, SIGQUIT, SIGTERM})
        sigaddset(&ends, signal);
    sigprocmask(SIG_BLOCK, &ends, nullptr);
    FileDescriptor signals(signalfd(-1, &ends, SFD_NONBLOCK | SFD_CLOEXEC));
    if (signals.get() < 0)
        throw std::system_error(errno, std::generic_category(), "cannot wait for signals");
    return signals;
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

timespec until(TimePoint wake) {
    const auto left = std::max(wake - Clock::now(), Clock::duration::zero());
    const auto whole = std::chrono::duration_cast<std::chrono::seconds>(left);
    return {whole.count(), std::chrono::nanoseconds(left - whole).count()};
}

} // namespace

Emulator::Emulator(const Options &options, std::optional<Journey> journey)
    : line_(options.fast, options.trace),
      keypad_([this](Key key) { line_.answer(traits(key).code); }), signals_(openSignals()) {
    setenv("PANEL_TTY", line_.path().c_str(), 1);
    FileDescriptor commandOutput;
    if (journey) {
        player_.emplace(std::move(*journey), JourneyPlayer::Panel{display_, keypad_}, std::cout,
                        options.limit, options.pictures);
    } else {
        std::array<int, 2> ends{};
        if (pipe2(ends.data(), O_CLOEXEC) != 0)
            throw std::system_error(errno, std::generic_category(), "cannot open a pipe");
        output_ = FileDescriptor(ends[0]);
        commandOutput = FileDescriptor(ends[1]);
        fcntl(output_.get(), F_SETFL, O_NONBLOCK);
        front_ = std::make_unique<TerminalFront>(display_, keypad_);
    }
    command_ = std::make_unique<ChildProcess>(withPath(options.command, line_.path()),
                                              commandOutput.get());
    setenv("PANEL_COMMAND_PID", std::to_string(command_->pid()).c_str(), 1);
}

int Emulator::run() {
    for (;;) {
        waitForEvents();
        if (const std::optional<int> signal = takeSignal())
            return finish(signalStatus + *signal);
        line_.collect();
        drainOutput();
        const TimePoint now = Clock::now();
        bool over = advance(now);
        while (const std::optional<Line::Byte> byte = line_.next(now)) {
            if (display_.receive(byte->value))
                keypad_.request(byte->sinceAnswerRead);
            if (hasTerminal())
                front_->count(byte->value);
            // After each byte, so that no state of the panel is missed.
            over = over || advance(now);
        }
        if (over)
            return finish(EXIT_SUCCESS);
        if (hasTerminal())
            front_->draw(now);
        if (const std::optional<int> status = command_->status()) {
            if (hasTerminal())
                return finish(*status);
            throw std::runtime_error("the command ended with status " + std::to_string(*status) +
                                     " before the journey did\nshown:\n" +
                                     Picture(display_).text());
        }
    }
}

void Emulator::waitForEvents() {
    std::array<pollfd, 6> events{{{signals_.get(), POLLIN, 0},
                                  {command_->descriptor(), POLLIN, 0},
                                  {line_.descriptor(), POLLIN, 0},
                                  {output_.get(), POLLIN, 0},
                                  {hasTerminal() ? STDIN_FILENO : -1, POLLIN, 0},
                                  {player_ ? player_->descriptor() : -1, POLLIN, 0}}};
    TimePoint wake = hasTerminal() ? front_->wakeAt() : player_->wakeAt();
    if (const std::optional<TimePoint> line = line_.wakeAt())
        wake = std::min(wake, *line);
    const timespec timeout = until(wake);
    ppoll(events.data(), events.size(), &timeout, nullptr);
}

void Emulator::drainOutput() {
    std::array<char, tailBytes> bytes{};
    ssize_t count = 0;
    while (output_.get() >= 0 && (count = read(output_.get(), bytes.data(), bytes.size())) > 0) {
        outputTail_.append(bytes.data(), static_cast<std::size_t>(count));
        if (outputTail_.size() > tailBytes)
            outputTail_.erase(0, outputTail_.size() - tailBytes);
    }
    if (output_.get() >= 0 && count == 0)
        output_.reset();
}

bool Emulator::advance(TimePoint now) {
    return hasTerminal() ? !front_->handleInput(now) : player_->advance(now);
}

std::optional<int> Emulator::takeSignal() {
    signalfd_siginfo info{};
    if (read(signals_.get(), &info, sizeof info) <= 0)
        return std::nullopt;
    return static_cast<int>(info.ssi_signo);
}

int Emulator::finish(int status) {
    front_.reset();
    const bool endedByItself = command_->status().has_value();
    command_.reset();
    drainOutput();
    if (endedByItself)
        std::cerr << outputTail_;
    if (player_ && display_.unknownCommands() + display_.hiddenCharacters() > 0) {
        std::cout << "unknown commands: " << display_.unknownCommands()
                  << ", characters past the visible columns: " << display_.hiddenCharacters()
                  << '\n'
                  << std::flush;
    }
    return status;
}

} // namespace emulator
