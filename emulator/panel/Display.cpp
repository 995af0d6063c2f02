#include "emulator/panel/Display.h"

namespace emulator {

namespace {

constexpr int positions = Display::rowCount * Display::columns;

constexpr unsigned char commandPrefix = 0xFE;

enum Command : unsigned char {
    noOperation = 0x00,
    clearDisplay = 0x01,
    cursorHome = 0x02,
    readKey = 0x06,
    cursorOff = 0x0C,
    cursorBlink = 0x0D,
    cursorLeft = 0x10,
    cursorRight = 0x14,
    functionSet = 0x28,
    moduleRow1Address = 0x40,
    row0Address = 0x80,
    row1Address = 0xC0,
};

} // namespace

Display::Display() {
    clear();
}

bool Display::receive(unsigned char byte) {
    if (byte == commandPrefix) {
        // A prefix follows a prefix, so the command between them was lost.
        if (commandFollows)
            unknownCount++;
        commandFollows = true;
        return false;
    }
    if (!commandFollows) {
        write(byte);
        return false;
    }
    commandFollows = false;
    return execute(byte);
}

std::string Display::visibleRow(int row) const {
    return wholeRow(row).substr(0, visibleColumns);
}

std::string Display::wholeRow(int row) const {
    return rows.at(static_cast<std::size_t>(row));
}

int Display::cursorRow() const {
    return position / columns;
}

int Display::cursorColumn() const {
    return position % columns;
}

std::optional<Display::Place> Display::visibleCursor() const {
    if (!isBlinking || cursorColumn() >= visibleColumns)
        return std::nullopt;
    return Place{cursorRow(), cursorColumn()};
}

bool Display::execute(unsigned char command) {
    switch (command) {
    case noOperation:
        return false;
    case functionSet:
        functionSets++;
        return false;
    case clearDisplay:
        clear();
        return false;
    case cursorHome:
        position = 0;
        return false;
    case cursorOff:
        isBlinking = false;
        return false;
    case cursorBlink:
        isBlinking = true;
        return false;
    case cursorLeft:
        position = (position + positions - 1) % positions;
        return false;
    case cursorRight:
        position = (position + 1) % positions;
        return false;
    case readKey:
        return true;
    default:
        break;
    }
    // Address 68 hex is one past the end of row 1. The counter takes it as it takes running past
    // 67 hex, starting over at 00, so that a step to the left from it is row 1's last column.
    if (command >= moduleRow1Address && command <= moduleRow1Address + columns) {
        position = (columns + command - moduleRow1Address) % positions;
    } else if (command >= row1Address && command < row1Address + columns) {
        position = columns + command - row1Address;
    } else if (command >= row0Address && command < row0Address + columns) {
        position = command - row0Address;
    } else {
        unknownCount++;
    }
    return false;
}

void Display::write(unsigned char character) {
    const int column = cursorColumn();
    if (column >= visibleColumns)
        hiddenCount++;
    rows.at(static_cast<std::size_t>(cursorRow())).at(static_cast<std::size_t>(column)) =
        static_cast<char>(character);
    position = (position + 1) % positions;
}

void Display::clear() {
    rows.fill(std::string(columns, ' '));
    position = 0;
}

} // namespace emulator
