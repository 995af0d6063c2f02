#include "emulator/terminal/TerminalKeys.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <utility>

namespace emulator {

namespace {

constexpr char escapeByte = '\033';
// How long an ESC may be the start of a sequence, and how long a sequence may pause.
constexpr std::chrono::milliseconds loneEscape{25};
constexpr std::chrono::milliseconds brokenSequence{200};
constexpr std::size_t longestSequence = 32;

// The sequences that terminals in use send after ESC for these keys.
struct KeySequence {
    std::string_view text;
    TerminalKeys::Event event;
};
const std::array keySequences{
    KeySequence{"[A", TerminalKeys::Tap{Key::up}},
    KeySequence{"OA", TerminalKeys::Tap{Key::up}},
    KeySequence{"[B", TerminalKeys::Tap{Key::down}},
    KeySequence{"OB", TerminalKeys::Tap{Key::down}},
    KeySequence{"OM", TerminalKeys::Tap{Key::enter}},
    KeySequence{"[13u", TerminalKeys::Tap{Key::enter}},
    KeySequence{"[27u", TerminalKeys::Tap{Key::escape}},
    // With Shift:
    KeySequence{"[1;2A", TerminalKeys::Hold{Key::up}},
    KeySequence{"[a", TerminalKeys::Hold{Key::up}},
    KeySequence{"[1;2B", TerminalKeys::Hold{Key::down}},
    KeySequence{"[b", TerminalKeys::Hold{Key::down}},
    KeySequence{"[13;2u", TerminalKeys::Hold{Key::enter}},
    KeySequence{"[27;2;13~", TerminalKeys::Hold{Key::enter}},
    KeySequence{"[27;2u", TerminalKeys::Hold{Key::escape}},
    KeySequence{"[27;2;27~", TerminalKeys::Hold{Key::escape}},
};

bool isFinal(char byte) {
    return byte >= '@' && byte <= '~';
}

// A mouse report is "[<BUTTON;COLUMN;ROW" and M for down or m for up, counted from 1.
std::optional<TerminalKeys::Event> mouseEvent(const std::string &text) {
    constexpr unsigned modifiers = 0x1C; // Shift, Alt and Ctrl, held with the button
    unsigned button = 0, column = 0, row = 0;
    char direction = 0;
    if (std::sscanf(text.c_str(), "[<%5u;%5u;%5u%c", &button, &column, &row, &direction) != 4)
        return std::nullopt;
    if (direction == 'm')
        return TerminalKeys::MouseUp{};
    if (direction != 'M' || (button & ~modifiers) != 0 || column == 0 || row == 0)
        return std::nullopt;
    return TerminalKeys::MouseDown{static_cast<int>(row) - 1, static_cast<int>(column) - 1};
}

} // namespace

std::vector<TerminalKeys::Event> TerminalKeys::take(std::string_view bytes, TimePoint now) {
    std::vector<Event> events = look(now);
    lastByte = now;
    for (const char byte : bytes)
        takeByte(byte, events);
    return events;
}

std::vector<TerminalKeys::Event> TerminalKeys::look(TimePoint now) {
    std::vector<Event> events;
    if (const std::optional<TimePoint> end = wakeAt(); end && now >= *end) {
        if (sequence.size() == 1)
            events.emplace_back(Tap{Key::escape});
        sequence.clear();
    }
    return events;
}

std::optional<TimePoint> TerminalKeys::wakeAt() const {
    if (sequence.empty())
        return std::nullopt;
    return lastByte + (sequence.size() == 1 ? loneEscape : brokenSequence);
}

void TerminalKeys::takeByte(char byte, std::vector<Event> &events) {
    if (byte == escapeByte) {
        if (sequence.size() == 1)
            events.emplace_back(Tap{Key::escape});
        sequence = byte;
        return;
    }
    if (sequence.empty()) {
        takeCharacter(byte, events);
        return;
    }
    sequence += byte;
    const bool isIntroducer = sequence.size() == 2 && (byte == '[' || byte == 'O');
    const bool isOpen = sequence.size() > 2 && sequence[1] == '[' && !isFinal(byte);
    if (isIntroducer || (isOpen && sequence.size() < longestSequence))
        return;
    finishSequence(events);
}

void TerminalKeys::finishSequence(std::vector<Event> &events) {
    const std::string text = std::exchange(sequence, "").substr(1);
    const auto *known = std::find_if(keySequences.begin(), keySequences.end(),
                                     [&](const KeySequence &each) { return each.text == text; });
    if (known != keySequences.end())
        events.push_back(known->event);
    else if (const std::optional<Event> mouse = mouseEvent(text))
        events.push_back(*mouse);
}

void TerminalKeys::takeCharacter(char byte, std::vector<Event> &events) {
    if (byte == '\r' || byte == '\n') {
        events.emplace_back(Tap{Key::enter});
        return;
    }
    if (byte == 'q') {
        events.emplace_back(Quit{});
        return;
    }
    for (const KeyTraits &key : keys) {
        if (key.letter == byte) {
            events.emplace_back(Hold{key.key});
            return;
        }
    }
    events.emplace_back(Other{});
}

} // namespace emulator
