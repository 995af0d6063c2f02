#include "emulator/terminal/TerminalScreen.h"

// Only the functions: the macros of the same names would replace words like `clear` and `move`.
#define NCURSES_NOMACROS
#include <curses.h>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <clocale>
#include <cstdlib>
#include <stdexcept>

namespace emulator {

namespace {

// The panel needs 12 lines of 72 columns.
constexpr int mostLines = 100;
constexpr int mostColumns = 200;

constexpr const char *pasteOn = "\033[?2004h", *pasteOff = "\033[?2004l";
constexpr const char *mouseOn = "\033[?1000h\033[?1006h", *mouseOff = "\033[?1006l\033[?1000l";

} // namespace

TerminalScreen::TerminalScreen(bool itHasMouse) : hasMouse(itHasMouse) {
    const char *name = ttyname(STDOUT_FILENO);
    terminal = FileDescriptor(
        name == nullptr ? -1 : open(name, O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    written.reset(fdopen(memfd_create("screen", MFD_CLOEXEC), "w"));
    if (terminal.get() < 0 || written == nullptr)
        throw std::runtime_error("the terminal cannot be opened");
    tcgetattr(STDIN_FILENO, &formerSettings);
    std::setlocale(LC_ALL, "");
    // Otherwise ncurses would take its size from the environment, however large that is.
    unsetenv("LINES");
    unsetenv("COLUMNS");
    drawing = newterm(nullptr, written.get(), stdin);
    if (drawing == nullptr)
        throw std::runtime_error("this kind of terminal cannot be drawn on: check TERM");
    setInput();
    resize();
    curs_set(0);
    setModes();
}

TerminalScreen::~TerminalScreen() {
    leave();
    delscreen(drawing);
}

void TerminalScreen::setModes() {
    pending += pasteOn;
    if (hasMouse)
        pending += mouseOn;
}

// Keys come at once and are not echoed. Ctrl-S has no meaning here, because a stopped terminal
// would stop the panel.
void TerminalScreen::setInput() {
    termios settings = formerSettings;
    settings.c_iflag &= ~static_cast<tcflag_t>(IXON | ICRNL);
    settings.c_oflag &= ~static_cast<tcflag_t>(OPOST);
    settings.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO);
    settings.c_cc[VMIN] = 1;
    settings.c_cc[VTIME] = 0;
    tcsetattr(STDIN_FILENO, TCSANOW, &settings);
}

bool TerminalScreen::isReady() {
    push();
    return pending.empty();
}

void TerminalScreen::push() {
    const ssize_t taken = write(terminal.get(), pending.data(), pending.size());
    if (taken > 0)
        pending.erase(0, static_cast<std::size_t>(taken));
}

void TerminalScreen::refresh() {
    wrefresh(stdscr);
    collect();
    push();
}

void TerminalScreen::collect() {
    std::fflush(written.get());
    const int memory = fileno(written.get());
    std::string text(static_cast<std::size_t>(lseek(memory, 0, SEEK_END)), '\0');
    const ssize_t count = pread(memory, text.data(), text.size(), 0);
    pending.append(text, 0, static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
    lseek(memory, 0, SEEK_SET);
    if (ftruncate(memory, 0) != 0)
        throw std::runtime_error("what is drawn on the terminal cannot be kept");
}

void TerminalScreen::resize() {
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_row > 0 && size.ws_col > 0)
        resizeterm(std::min<int>(size.ws_row, mostLines), std::min<int>(size.ws_col, mostColumns));
}

void TerminalScreen::leave() {
    if (!isReady()) {
        tcflush(terminal.get(), TCOFLUSH); // what nobody reads would delay the end
        pending.clear();
    }
    pending += pasteOff;
    if (hasMouse)
        pending += mouseOff;
    endwin();
    collect();
    push();
    tcsetattr(STDIN_FILENO, TCSANOW, &formerSettings);
}

void TerminalScreen::enter() {
    setInput();
    resize();
    setModes();
    wrefresh(curscr); // the whole screen again
    collect();
}

} // namespace emulator
