#include "emulator/terminal/TerminalFront.h"

#include "emulator/panel/Font.h"

// Only the functions: the macros of the same names would replace words like `clear` and `move`.
#define NCURSES_NOMACROS
#include <curses.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <stdexcept>
#include <string>
#include <unistd.h>

namespace emulator {

namespace {

constexpr std::chrono::milliseconds frameTime{100};
constexpr std::chrono::milliseconds blinkTime{400};
constexpr std::chrono::milliseconds leastLit{200}; // because a tap may be answered at once

constexpr short glassColours = 1;

struct Cell {
    int y, x;
};

constexpr Cell panelAt{0, 1};
constexpr Cell panelSize{6, 46};
constexpr Cell glassAt{1, 3};
constexpr Cell glassSize{Display::rowCount + 2, Display::visibleColumns + 2};
constexpr int lineAt = 7;
constexpr int countsAt = 8;
constexpr int helpAt = 10;
constexpr int wordAt = 11;

struct DrawnKey {
    Cell at;
    const char *label;
};

constexpr int keyWidth = 10;
constexpr std::array<DrawnKey, keys.size()> drawnKeys{{
    {{1, 23}, "[   Up   ]"},
    {{4, 23}, "[  Down  ]"},
    {{1, 35}, "[ Enter  ]"},
    {{4, 35}, "[ Escape ]"},
}};

constexpr std::size_t index(Key key) {
    return static_cast<std::size_t>(key);
}

void put(Cell at, const std::string &text, attr_t attributes = A_NORMAL) {
    if (at.y >= LINES || at.x >= COLS)
        return;
    attrset(static_cast<int>(attributes));
    mvaddnstr(at.y, at.x, text.c_str(), COLS - at.x);
}

void frame(Cell at, Cell size) {
    if (at.y + size.y > LINES || at.x + size.x > COLS)
        return;
    WINDOW *window = subwin(stdscr, size.y, size.x, at.y, at.x);
    box(window, 0, 0);
    delwin(window);
}

FileDescriptor openKeyboard() {
    const char *name = ttyname(STDIN_FILENO);
    FileDescriptor keyboard(name == nullptr ? -1 : open(name, O_RDONLY | O_NOCTTY | O_CLOEXEC));
    if (keyboard.get() < 0)
        throw std::runtime_error("the terminal cannot be opened");
    return keyboard;
}

} // namespace

TerminalFront::TerminalFront(Loop &loop, const Display &itsDisplay, Keypad &itsKeypad, Use itsUse)
    : screen(itsUse == Use::operate), keyboard(openKeyboard()), display(itsDisplay),
      keypad(itsKeypad), use(itsUse), input(loop, keyboard.get(), [this] { readInput(); }),
      finger(itsKeypad), load(Clock::now()) {
    if (has_colors()) {
        start_color();
        use_default_colors();
        init_pair(glassColours, COLOR_BLACK, COLOR_GREEN);
    }
}

std::optional<int> TerminalFront::look(TimePoint now) {
    act(decoder.look(now), now);
    finger.look(now);
    if (const std::optional<Key> down = keypad.down())
        litUntil.at(index(*down)) = now + leastLit;
    if (now >= drawAgain)
        draw(now);
    if (isGone && use == Use::watch)
        throw std::runtime_error("the terminal has gone away");
    return isOver || isGone ? std::optional<int>(EXIT_SUCCESS) : std::nullopt;
}

std::optional<TimePoint> TerminalFront::wakeAt() const {
    TimePoint wake = drawAgain;
    for (const std::optional<TimePoint> other : {decoder.wakeAt(), finger.wakeAt()})
        wake = std::min(wake, other.value_or(TimePoint::max()));
    return wake;
}

void TerminalFront::resize() {
    screen.resize();
    drawAgain = {};
}

void TerminalFront::readInput() {
    std::array<char, 256> bytes{};
    const ssize_t count = read(keyboard.get(), bytes.data(), bytes.size());
    if (count < 0 && (errno == EINTR || errno == EAGAIN))
        return;
    // If the terminal has gone away, reading gives the end of file or fails.
    if (count <= 0) {
        input.pause(true);
        isGone = true;
        return;
    }
    const TimePoint now = Clock::now();
    act(decoder.take({bytes.data(), static_cast<std::size_t>(count)}, now), now);
    drawAgain = {};
}

void TerminalFront::act(const std::vector<TerminalKeys::Event> &events, TimePoint now) {
    for (const TerminalKeys::Event &event : events) {
        if (use == Use::operate || std::holds_alternative<TerminalKeys::Quit>(event))
            std::visit([&](const auto &what) { act(what, now); }, event);
    }
}

void TerminalFront::act(const TerminalKeys::Tap &tap, TimePoint now) {
    finger.tap(tap.key, now);
}

void TerminalFront::act(const TerminalKeys::Hold &hold, TimePoint) {
    finger.hold(hold.key);
}

void TerminalFront::act(const TerminalKeys::MouseDown &mouse, TimePoint now) {
    for (const KeyTraits &key : keys) {
        const Cell at = drawnKeys.at(index(key.key)).at;
        if (mouse.row == at.y && mouse.column >= at.x && mouse.column < at.x + keyWidth)
            finger.press(key.key, now);
    }
}

void TerminalFront::act(const TerminalKeys::MouseUp &, TimePoint now) {
    finger.release(now);
}

void TerminalFront::act(const TerminalKeys::Quit &, TimePoint) {
    isOver = true;
}

void TerminalFront::act(const TerminalKeys::Other &, TimePoint) {
    finger.letGo();
}

void TerminalFront::stopWith(const std::function<void()> &stop) {
    screen.leave();
    stop();
    screen.enter();
    drawAgain = {};
}

void TerminalFront::draw(TimePoint now) {
    drawAgain = now + frameTime;
    if (!screen.isReady())
        return;
    erase();
    attrset(A_NORMAL);
    frame(panelAt, panelSize);
    frame(glassAt, glassSize);
    drawGlass(now);
    drawKeys(now);
    drawLine(now);
    put({helpAt, panelAt.x},
        use == Use::operate ? "arrows, Enter, Escape: tap   with Shift, or u d e x: hold   q: quit"
                            : "a journey is being played   q: quit");
    put({wordAt, panelAt.x}, word);
    screen.refresh();
}

void TerminalFront::drawGlass(TimePoint now) const {
    const attr_t colours = has_colors() ? static_cast<attr_t>(COLOR_PAIR(glassColours)) : A_NORMAL;
    for (int row = 0; row < Display::rowCount; row++)
        put({glassAt.y + 1 + row, glassAt.x + 1}, printable(display.visibleRow(row)), colours);
    const bool isOn = now.time_since_epoch() / blinkTime % 2 == 0;
    if (const auto cursor = display.visibleCursor(); cursor && isOn)
        put({glassAt.y + 1 + cursor->row, glassAt.x + 1 + cursor->column}, " ",
            colours | A_REVERSE);
}

void TerminalFront::drawKeys(TimePoint now) {
    for (const KeyTraits &key : keys) {
        const bool lit = keypad.down() == key.key || now < litUntil.at(index(key.key));
        const DrawnKey &drawn = drawnKeys.at(index(key.key));
        put(drawn.at, drawn.label, lit ? A_REVERSE | A_BOLD : A_NORMAL);
    }
}

void TerminalFront::drawLine(TimePoint now) {
    load.look(now);
    std::array<char, 64> rate{};
    std::snprintf(rate.data(), rate.size(), "%4.0f bytes/s %4.0f %% of the line",
                  load.bytesPerSecond(), load.percent());
    std::string bytes = load.recentBytes();
    bytes.resize(3 * LineLoad::mostRecent, ' ');
    put({lineAt, panelAt.x}, bytes + rate.data());
    put({countsAt, panelAt.x},
        "unknown commands: " + std::to_string(display.unknownCommands()) +
            ", characters past the visible columns: " + std::to_string(display.hiddenCharacters()));
}

} // namespace emulator
