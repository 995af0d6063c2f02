#include "emulator/terminal/TerminalRescue.h"

#include <curses.h>
#include <term.h>
#include <termios.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <cstdint>
#include <stdexcept>

namespace emulator {

namespace {

// Everything that the handler needs is prepared, because it must not allocate. Nor may it take a
// sequence from ncurses, whose own state may be broken.
struct State {
    termios settings;
    std::array<char, 256> sequences;
    std::size_t length;
};
State state;

constexpr std::array crashes{SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGABRT, SIGSYS, SIGTRAP};
std::array<struct sigaction, crashes.size()> formerActions;

int keep(int byte) {
    if (state.length < state.sequences.size())
        state.sequences.at(state.length++) = static_cast<char>(byte);
    return byte;
}

const char *sequence(const char *name) {
    const char *value = tigetstr(name);
    return reinterpret_cast<std::intptr_t>(value) == -1 ? nullptr : value;
}

void prepare() {
    state.length = 0;
    tputs("\033[?2004l\033[?1006l\033[?1000l", 1, keep); // reports of pastes and the mouse off
    for (const char *name : {"sgr0", "cnorm", "rmkx", "rmcup"})
        if (const char *value = sequence(name))
            tputs(value, 1, keep);
}

void restore(int signal) {
    tcsetattr(STDIN_FILENO, TCSANOW, &state.settings);
    // Nothing can be done about a failure.
    [[maybe_unused]] const ssize_t written =
        write(STDOUT_FILENO, state.sequences.data(), state.length);
    for (std::size_t i = 0; i < crashes.size(); i++)
        if (crashes.at(i) == signal)
            sigaction(signal, &formerActions.at(i), nullptr);
    raise(signal); // takes effect when this handler has returned, and ends the program as it should
}

} // namespace

TerminalRescue::TerminalRescue() {
    tcgetattr(STDIN_FILENO, &state.settings);
    int known = 0;
    if (setupterm(nullptr, STDOUT_FILENO, &known) != OK)
        throw std::runtime_error("this kind of terminal is not known: check TERM");
    if (sequence("cup") == nullptr)
        throw std::runtime_error("this kind of terminal cannot place its cursor: check TERM");
    prepare();
    del_curterm(cur_term);
    struct sigaction action{};
    action.sa_handler = restore;
    sigemptyset(&action.sa_mask);
    for (std::size_t i = 0; i < crashes.size(); i++)
        sigaction(crashes.at(i), &action, &formerActions.at(i));
}

TerminalRescue::~TerminalRescue() {
    for (std::size_t i = 0; i < crashes.size(); i++)
        sigaction(crashes.at(i), &formerActions.at(i), nullptr);
}

} // namespace emulator
