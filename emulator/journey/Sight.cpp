#include "emulator/journey/Sight.h"

#include "emulator/panel/Picture.h"

namespace emulator {

namespace {

// In a list that scrolls, the last column tells that there is more above or below.
bool isChosen(std::string row, const std::string &entry) {
    if (row.back() == '^' || row.back() == 'v')
        row.back() = ' ';
    const std::size_t begin = row.find_first_not_of(' ', 1);
    const std::size_t end = row.find_last_not_of(' ') + 1;
    return row.front() == '>' && begin < end && row.substr(begin, end - begin) == entry;
}

bool blinksAt(const Display &display, const Display::Place &cursor) {
    return display.cursorBlinking() && display.cursorRow() == cursor.row &&
           display.cursorColumn() == cursor.column;
}

} // namespace

bool Sight::isShownBy(const Display &display) const {
    const std::string shown0 = display.visibleRow(0), shown1 = display.visibleRow(1);
    return row0.value_or(shown0) == shown0 && row1.value_or(shown1) == shown1 &&
           (!cursor || blinksAt(display, *cursor)) &&
           (!chosen || isChosen(shown0, *chosen) || isChosen(shown1, *chosen));
}

std::string Sight::text() const {
    if (chosen)
        return "> " + *chosen + "\n";
    const Picture picture({row0.value_or("(any)"), row1.value_or("(any)")});
    return picture.text() + (cursor ? "with the cursor at row " + std::to_string(cursor->row) +
                                          ", column " + std::to_string(cursor->column) + "\n"
                                    : "");
}

} // namespace emulator
