#include "emulator/journey/Recorder.h"

#include "emulator/journey/words.h"
#include "emulator/panel/Font.h"

#include <algorithm>
#include <utility>

namespace emulator {

namespace {

std::string withoutBlanksAtEnd(std::string text) {
    text.erase(text.find_last_not_of(' ') + 1);
    return text;
}

// The step that expects what the display shows. There is none if a journey cannot express it, such
// as a character outside ASCII.
std::string stepThatExpects(const Display &display) {
    const std::string row0 = display.visibleRow(0), row1 = display.visibleRow(1);
    if (!std::all_of(row0.begin(), row0.end(), isPrintable) ||
        !std::all_of(row1.begin(), row1.end(), isPrintable))
        return "";
    std::string step =
        "expect " + quoted(withoutBlanksAtEnd(row0)) + " " + quoted(withoutBlanksAtEnd(row1));
    if (display.cursorBlinking())
        step += " at " + std::to_string(display.cursorRow()) + " " +
                std::to_string(display.cursorColumn());
    return step + "\n";
}

} // namespace

Recorder::Recorder(std::ostream &itsOutput, const Display &itsDisplay, const Keypad &itsKeypad)
    : display(itsDisplay), keypad(itsKeypad), output(itsOutput), answersSeen(keypad.answered()),
      requestsSeen(keypad.requests()) {}

std::optional<int> Recorder::look(TimePoint) {
    // A key that is answered at its request was pressed while the panel showed what it does now:
    // the request comes behind everything that the program has drawn before it.
    const bool isAsked = keypad.requests() != requestsSeen;
    requestsSeen = keypad.requests();
    if (isAsked && !std::exchange(hasBegun, true)) {
        // The longest that the program keeps a page is a minute.
        output << "# Recorded at the panel.\nlimit 90\n" << std::flush;
    }
    if (isAsked || keypad.answered() != answersSeen)
        sight = stepThatExpects(display);
    countAnswers();
    if (held && keypad.settled())
        writeStroke(true);
    return std::nullopt;
}

void Recorder::countAnswers() {
    if (keypad.answered() == answersSeen)
        return;
    answersSeen = keypad.answered();
    const Key key = keypad.lastAnswer();
    if (!held || held->key != key) {
        if (held)
            writeStroke(false);
        // While a key is down, the program goes on counting it, so a journey cannot wait for
        // anything.
        if (!isKeyDown)
            output << sight;
    }
    held = Held{key, keypad.heldPolls()};
    sight.clear(); // what the key has done is not seen before the next request
}

std::string Recorder::stroke(bool isReleased) const {
    if (!held)
        return "";
    const std::string name(traits(held->key).name);
    // The one poll of a tap could not be told from those of a key that is still down.
    if (held->polls == 1 && isReleased && !isKeyDown)
        return "tap " + name + "\n";
    return "hold " + name + " " + std::to_string(held->polls) + "\n" +
           (isReleased ? "release\n" : "");
}

void Recorder::writeStroke(bool isReleased) {
    output << stroke(isReleased) << std::flush;
    isKeyDown = !isReleased;
    held.reset();
}

std::string Recorder::end() const {
    return stroke(true) + sight;
}

void Recorder::finish() {
    countAnswers(); // the last answer may have come after the last look
    if (hasBegun)
        output << end() << std::flush;
}

} // namespace emulator
