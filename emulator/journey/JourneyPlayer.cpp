#include "emulator/journey/JourneyPlayer.h"

#include "emulator/panel/Picture.h"

#include <stdexcept>
#include <utility>

namespace emulator {

namespace {

constexpr std::chrono::seconds runLimit{60};

[[noreturn]] void fail(const std::string &reason) {
    throw std::runtime_error(reason);
}

constexpr std::size_t rememberedSights = 3;

std::string described(const step::ExpectCursor &cursor) {
    return "row " + std::to_string(cursor.place.row) + ", column " +
           std::to_string(cursor.place.column) + (cursor.blinking ? ", on" : ", off");
}

step::ExpectCursor cursorOf(const Display &display) {
    return {{display.cursorRow(), display.cursorColumn()}, display.cursorBlinking()};
}

bool isSame(const step::ExpectCursor &one, const step::ExpectCursor &other) {
    return one.place.row == other.place.row && one.place.column == other.place.column &&
           one.blinking == other.blinking;
}

char letterAtCursor(const Display &display) {
    return display.wholeRow(display.cursorRow())
        .at(static_cast<std::size_t>(display.cursorColumn()));
}

} // namespace

JourneyPlayer::JourneyPlayer(Journey itsJourney, Panel itsPanel, Surroundings &itsSurroundings,
                             std::ostream &itsOutput, Clock::duration firstLimit,
                             std::optional<std::filesystem::path> picturesFolder)
    : journey(std::move(itsJourney)), panel(itsPanel), surroundings(itsSurroundings),
      output(itsOutput), limit(firstLimit), pictures(std::move(picturesFolder)) {}

bool JourneyPlayer::advance(TimePoint time) {
    now = time;
    while (next < journey.steps().size()) {
        const Step &step = journey.steps()[next];
        rememberSight();
        try {
            if (!hasBegun) {
                deadline = now + limit;
                requestsBefore = panel.keypad.requests();
            }
            const bool begins = !std::exchange(hasBegun, true);
            if (!std::visit([&](const auto &action) { return play(action, begins); },
                            step.action)) {
                if (now >= deadline)
                    fail(std::visit([&](const auto &action) { return complaint(action); },
                                    step.action));
                return false;
            }
        } catch (const std::runtime_error &error) {
            const std::string what =
                error.what(); // a picture at its end has a line feed of its own
            throw std::runtime_error(journey.place(step) + step.text + "\n" + what +
                                     (what.back() == '\n' ? "" : "\n") + sightsBefore());
        }
        hasBegun = false;
        next++;
    }
    return true;
}

// What the program has drawn before it asks for a key is what an operator sees.
void JourneyPlayer::rememberSight() {
    if (std::exchange(requestsSeen, panel.keypad.requests()) == panel.keypad.requests())
        return;
    const std::string sight = Picture(panel.display).text();
    if (sights.empty() || sights.back() != sight)
        sights.push_back(sight);
    if (sights.size() > rememberedSights)
        sights.pop_front();
}

std::string JourneyPlayer::sightsBefore() const {
    std::string text = "the last that the panel showed when it was asked for keys:\n";
    for (const std::string &sight : sights)
        text += sight;
    return sights.empty() ? "" : text;
}

void JourneyPlayer::goTo(std::size_t step) {
    next = step;
    hasBegun = false;
    for (std::size_t before = 0; before < step; before++) {
        if (const auto *set = std::get_if<step::Limit>(&journey.steps()[before].action))
            limit = set->time;
    }
}

bool JourneyPlayer::play(const step::Tap &tap, bool begins) {
    if (begins)
        tapsLeft = tap.count;
    else if (!panel.keypad.settled())
        return false;
    if (tap.until && tap.until->isShownBy(panel.display))
        return true;
    if (tapsLeft == 0 && tap.until)
        fail("after " + std::to_string(tap.count) + " taps, " +
             complaint(step::Expect{*tap.until}));
    if (tapsLeft == 0)
        return true;
    tapsLeft--;
    deadline = now + limit;
    panel.keypad.tap(tap.key);
    return false;
}

bool JourneyPlayer::play(const step::Keys &sequence, bool begins) {
    if (begins) {
        nextStroke = 0;
    } else {
        if (!isAnswered(sequence.strokes[nextStroke].polls))
            return false;
        panel.keypad.release();
        if (!panel.keypad.settled())
            return false;
        nextStroke++;
    }
    if (nextStroke == sequence.strokes.size())
        return true;
    const Stroke &stroke = sequence.strokes[nextStroke];
    awaitAnswers();
    // After a single poll the key has to come up at once.
    stroke.polls == 1 ? panel.keypad.tap(stroke.key) : panel.keypad.press(stroke.key);
    return false;
}

bool JourneyPlayer::play(const step::Hold &hold, bool begins) {
    if (begins) {
        awaitAnswers();
        panel.keypad.press(hold.key);
    }
    return isAnswered(hold.polls);
}

bool JourneyPlayer::play(const step::Release &, bool begins) {
    if (begins)
        panel.keypad.release();
    return panel.keypad.settled();
}

bool JourneyPlayer::play(const step::Wait &wait, bool begins) {
    if (begins)
        deadline = now + wait.time;
    return now >= deadline;
}

bool JourneyPlayer::play(const step::Expect &expect, bool) {
    return expect.sight.isShownBy(panel.display);
}

bool JourneyPlayer::play(const step::ExpectCursor &cursor, bool) {
    return isSame(cursorOf(panel.display), cursor);
}

bool JourneyPlayer::play(const step::ExpectLetter &expected, bool) {
    return letterAtCursor(panel.display) == expected.letter;
}

bool JourneyPlayer::play(const step::TakePicture &picture, bool) {
    const Picture taken(panel.display);
    output << taken.text() << std::flush;
    if (pictures)
        taken.write(*pictures / (picture.name + ".svg"));
    return true;
}

bool JourneyPlayer::play(const step::Say &say, bool) {
    output << say.text << '\n' << std::flush;
    return true;
}

bool JourneyPlayer::play(const step::Limit &newLimit, bool) {
    limit = newLimit.time;
    return true;
}

bool JourneyPlayer::play(const step::Run &run, bool begins) {
    if (begins) {
        deadline = now + runLimit;
        output.flush();
        surroundings.start(run);
    }
    return hasSucceeded();
}

bool JourneyPlayer::play(const step::Appliance &appliance, bool begins) {
    if (begins) {
        deadline = now + runLimit;
        output.flush();
        surroundings.start(appliance);
    }
    return hasSucceeded();
}

bool JourneyPlayer::play(const TestAction &action, bool begins) {
    if (begins) {
        const std::string fault = surroundings.act(action);
        if (!fault.empty())
            fail(fault);
    }
    return hasSucceeded();
}

std::string JourneyPlayer::complaint(const step::Expect &expect) const {
    return "the panel does not show what is expected\nwanted:\n" + expect.sight.text() + shown();
}

std::string JourneyPlayer::complaint(const step::ExpectLetter &expected) const {
    return std::string("the cursor is not on the letter\nwanted: ") + expected.letter +
           "\nis on:  " + letterAtCursor(panel.display) + "\n" + shown();
}

std::string JourneyPlayer::complaint(const step::ExpectCursor &cursor) const {
    return "the cursor is not where it is expected\nwanted: " + described(cursor) +
           "\nis at:  " + described(cursorOf(panel.display)) + "\n" + shown();
}

std::string JourneyPlayer::complaint(const step::Run &) const {
    return "the command is still running after 60 s";
}

std::string JourneyPlayer::complaint(const step::Appliance &) const {
    return "the appliance is still busy with it after 60 s";
}

std::string JourneyPlayer::complaint(const TestAction &) const {
    return "this has not happened\n" + shown();
}

void JourneyPlayer::awaitAnswers() {
    deadline = now + limit;
    answersBefore = answersLast = panel.keypad.answered();
}

bool JourneyPlayer::isAnswered(int polls) {
    const unsigned long answers = panel.keypad.answered();
    if (answers != answersLast)
        deadline = now + limit;
    answersLast = answers;
    return answers - answersBefore >= static_cast<unsigned long>(polls);
}

bool JourneyPlayer::hasSucceeded() {
    const std::optional<int> status = surroundings.status();
    if (status && *status != 0)
        fail("it ended with status " + std::to_string(*status));
    return status.has_value();
}

std::string JourneyPlayer::shown() const {
    return "shown:\n" + Picture(panel.display).text();
}

std::string JourneyPlayer::unansweredKey() const {
    const bool isAsked = panel.keypad.requests() != requestsBefore;
    return (isAsked ? "the program asks for keys, but does not read the answers\n"
                    : "the program does not ask for keys\n") +
           shown();
}

} // namespace emulator
