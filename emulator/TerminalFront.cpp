#include "TerminalFront.h"

#include "Font.h"

// As functions only: the macros of the same names would replace words like `clear` and `move`.
#define NCURSES_NOMACROS
#include <curses.h>

#include <algorithm>
#include <clocale>
#include <cstdio>
#include <string>

namespace emulator {

namespace {

constexpr int escapeDelay = 25; // ms until a lone ESC is the key and no sequence's start
constexpr std::chrono::milliseconds frameTime{100};
constexpr std::chrono::milliseconds blinkTime{400};
constexpr std::chrono::milliseconds leastLit{200}; // a tap may well be answered at once
constexpr std::chrono::seconds rateTime{1};
constexpr std::size_t mostTaps = 4;
constexpr std::size_t recentBytes = 12;
constexpr double lineBytesPerSecond = 2400.0 / 11;

constexpr short glassColours = 1;

// Codes for keys that ncurses has no name for.
constexpr int shiftEnter = KEY_MAX + 1;
constexpr int shiftEscape = KEY_MAX + 2;

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

} // namespace

TerminalFront::TerminalFront(const Display &display, Keypad &keypad)
    : display_(display), keypad_(keypad), countedSince_(Clock::now()) {
    std::setlocale(LC_ALL, "");
    initscr();
    cbreak();
    noecho();
    nonl();
    nodelay(stdscr, TRUE);
    ::keypad(stdscr, TRUE);
    set_escdelay(escapeDelay);
    curs_set(0);
    mousemask(BUTTON1_PRESSED | BUTTON1_RELEASED, nullptr);
    mouseinterval(0);
    if (has_colors()) {
        start_color();
        use_default_colors();
        init_pair(glassColours, COLOR_BLACK, COLOR_GREEN);
    }
    // The two ways in which terminals tell these keys' Shift, where they do.
    define_key("\033[13;2u", shiftEnter);
    define_key("\033[27;2;13~", shiftEnter);
    define_key("\033[27;2u", shiftEscape);
    define_key("\033[27;2;27~", shiftEscape);
}

TerminalFront::~TerminalFront() {
    endwin();
}

bool TerminalFront::handleInput(TimePoint now) {
    for (int code = getch(); code != ERR; code = getch()) {
        if (code == 'q')
            return false;
        handleCode(code);
    }
    if (!taps_.empty() && keypad_.settled()) {
        litUntil_.at(index(taps_.front())) = now + leastLit;
        keypad_.tap(taps_.front());
        taps_.pop_front();
    }
    return true;
}

void TerminalFront::count(unsigned char byte) {
    recent_.push_back(byte);
    if (recent_.size() > recentBytes)
        recent_.pop_front();
    counted_++;
}

void TerminalFront::draw(TimePoint now) {
    erase();
    attrset(A_NORMAL);
    frame(panelAt, panelSize);
    frame(glassAt, glassSize);
    drawGlass(now);
    drawKeys(now);
    drawLine(now);
    put({helpAt, panelAt.x}, "arrows, Enter, Escape: tap   with Shift, or u d e x: hold   q: quit");
    refresh();
    drawAgain_ = now + frameTime;
}

void TerminalFront::handleCode(int code) {
    switch (code) {
    case KEY_UP:
        return tap(Key::up);
    case KEY_DOWN:
        return tap(Key::down);
    case '\r':
    case '\n':
    case KEY_ENTER:
        return tap(Key::enter);
    case '\033':
        return tap(Key::escape);
    case KEY_SR:
    case 'u':
        return hold(Key::up);
    case KEY_SF:
    case 'd':
        return hold(Key::down);
    case shiftEnter:
    case 'e':
        return hold(Key::enter);
    case shiftEscape:
    case 'x':
        return hold(Key::escape);
    case KEY_MOUSE:
        return handleMouse();
    case KEY_RESIZE:
        return;
    default:
        letGo(std::nullopt);
    }
}

void TerminalFront::handleMouse() {
    MEVENT event{};
    if (getmouse(&event) != OK)
        return;
    if (clicked_) {
        clicked_ = false;
        keypad_.release();
    }
    if ((event.bstate & BUTTON1_PRESSED) == 0)
        return;
    for (const KeyTraits &key : keys) {
        const Cell at = drawnKeys.at(index(key.key)).at;
        if (event.y != at.y || event.x < at.x || event.x >= at.x + keyWidth)
            continue;
        letGo(key.key);
        taps_.clear();
        keypad_.press(key.key);
        clicked_ = true;
    }
}

void TerminalFront::tap(Key key) {
    if (!letGo(key) && taps_.size() < mostTaps)
        taps_.push_back(key);
}

void TerminalFront::hold(Key key) {
    if (letGo(key))
        return;
    taps_.clear();
    held_ = key;
    keypad_.press(key);
}

// Any key ends a hold; true if it was the held key itself, which then has no further effect.
bool TerminalFront::letGo(std::optional<Key> pressed) {
    if (!held_)
        return false;
    const bool same = held_ == pressed;
    held_.reset();
    keypad_.release();
    return same;
}

void TerminalFront::drawGlass(TimePoint now) const {
    const attr_t colours = has_colors() ? static_cast<attr_t>(COLOR_PAIR(glassColours)) : A_NORMAL;
    for (int row = 0; row < Display::rowCount; row++) {
        std::string text = display_.visibleRow(row);
        std::replace_if(
            text.begin(), text.end(), [](char c) { return !isPrintable(c); }, '?');
        put({glassAt.y + 1 + row, glassAt.x + 1}, text, colours);
    }
    const bool on = now.time_since_epoch() / blinkTime % 2 == 0;
    const int column = display_.cursorColumn();
    if (display_.cursorBlinking() && on && column < Display::visibleColumns)
        put({glassAt.y + 1 + display_.cursorRow(), glassAt.x + 1 + column}, " ",
            colours | A_REVERSE);
}

void TerminalFront::drawKeys(TimePoint now) {
    for (const KeyTraits &key : keys) {
        const bool lit = keypad_.down() == key.key || now < litUntil_.at(index(key.key));
        const DrawnKey &drawn = drawnKeys.at(index(key.key));
        put(drawn.at, drawn.label, lit ? A_REVERSE | A_BOLD : A_NORMAL);
    }
}

void TerminalFront::drawLine(TimePoint now) {
    const std::chrono::duration<double> time = now - countedSince_;
    if (time >= rateTime) {
        bytesPerSecond_ = static_cast<double>(counted_) / time.count();
        counted_ = 0;
        countedSince_ = now;
    }
    std::array<char, 64> rate{};
    std::string bytes;
    for (const unsigned char byte : recent_) {
        std::snprintf(rate.data(), rate.size(), "%02X ", static_cast<unsigned>(byte));
        bytes += rate.data();
    }
    bytes.resize(3 * recentBytes, ' ');
    std::snprintf(rate.data(), rate.size(), "%4.0f bytes/s %4.0f %% of the line", bytesPerSecond_,
                  100 * bytesPerSecond_ / lineBytesPerSecond);
    put({lineAt, panelAt.x}, bytes + rate.data());
    put({countsAt, panelAt.x}, "unknown commands: " + std::to_string(display_.unknownCommands()) +
                                   ", characters past the visible columns: " +
                                   std::to_string(display_.hiddenCharacters()));
}

} // namespace emulator
