#include "emulator/terminal/TerminalKeys.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <utility>

namespace emulator {

namespace {

constexpr char escapeByte = '\033';
// How long an ESC may be the start of a sequence, which a slow connection delivers in pieces, and
// how long a sequence or a pasted text may pause.
constexpr std::chrono::milliseconds loneEscape{150};
constexpr std::chrono::milliseconds brokenSequence{250};
constexpr std::chrono::seconds brokenPaste{3};
constexpr std::size_t longestSequence = 32; // that is kept
constexpr std::string_view stringIntroducers = "]P_^X";
constexpr std::string_view pasteBegins = "[200~", pasteEnds = "[201~";

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
        if (isEscapes() && !isPasting)
            events.insert(events.end(), sequence.size(), Tap{Key::escape});
        sequence.clear();
        isPasting = false;
    }
    return events;
}

std::optional<TimePoint> TerminalKeys::wakeAt() const {
    if (sequence.empty() && !isPasting)
        return std::nullopt;
    if (isPasting)
        return lastByte + brokenPaste;
    return lastByte + (isEscapes() ? loneEscape : brokenSequence);
}

bool TerminalKeys::isEscapes() const {
    return !sequence.empty() && sequence.back() == escapeByte && !isInString();
}

void TerminalKeys::takeByte(char byte, std::vector<Event> &events) {
    if (isInString()) {
        takeStringByte(byte, events);
    } else if (byte == escapeByte) {
        // Two may be the start of a key with Alt, which some terminals send so.
        if (sequence.size() == 2 && sequence[1] == escapeByte)
            tapEscape(events);
        else if (sequence.size() > 1)
            sequence.clear();
        if (sequence.size() < 2)
            sequence += byte;
    } else if (!sequence.empty()) {
        takeSequenceByte(byte, events);
    } else if (!isPasting) {
        takeCharacter(byte, events);
    }
}

void TerminalKeys::tapEscape(std::vector<Event> &events) const {
    if (!isPasting)
        events.emplace_back(Tap{Key::escape});
}

void TerminalKeys::takeSequenceByte(char byte, std::vector<Event> &events) {
    // Escape was pressed while the terminal sent a string.
    if (sequence.size() == 2 && stringIntroducers.find(byte) != std::string_view::npos) {
        tapEscape(events);
        sequence.pop_back();
    }
    if (sequence.size() == longestSequence)
        sequence.pop_back(); // it is none of those that are known, but goes on
    sequence += byte;
    const std::size_t begin = sequence.find_last_of(escapeByte);
    const std::size_t length = sequence.size() - begin;
    const char introducer = sequence[begin + 1];
    const bool isControl = introducer == '[', isShort = introducer == 'O';
    const bool isComplete = (isControl && length > 2 && isFinal(byte)) || (isShort && length > 2) ||
                            (!isControl && !isShort && !isInString());
    if (isComplete)
        finishSequence(events);
}

// What a terminal answers to a question, for example about its colours, is a string of any length.
bool TerminalKeys::isInString() const {
    return sequence.size() > 1 && stringIntroducers.find(sequence[1]) != std::string_view::npos;
}

// A string ends with BEL or with ESC \, and any other sequence ends it, too.
void TerminalKeys::takeStringByte(char byte, std::vector<Event> &events) {
    if (sequence.back() == escapeByte) {
        sequence = byte == '\\' ? "" : std::string(1, escapeByte);
        if (!sequence.empty())
            takeByte(byte, events);
    } else if (byte == escapeByte) {
        sequence += byte;
    } else if (byte == '\a') {
        sequence.clear();
    }
}

void TerminalKeys::finishSequence(std::vector<Event> &events) {
    const std::string text = std::exchange(sequence, "").substr(1);
    if (text == pasteBegins || text == pasteEnds)
        isPasting = text == pasteBegins;
    if (isPasting)
        return;
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
