#include "JourneyPlayer.h"

#include <fstream>
#include <stdexcept>

namespace emulator {

namespace {

constexpr std::chrono::seconds runLimit{60};

} // namespace

JourneyPlayer::JourneyPlayer(Journey journey, Panel panel, std::ostream &output,
                             Clock::duration limit, std::optional<std::filesystem::path> pictures)
    : journey_(std::move(journey)), panel_(panel), output_(output), limit_(limit),
      pictures_(std::move(pictures)) {}

bool JourneyPlayer::advance(TimePoint now) {
    while (next_ < journey_.steps().size()) {
        const Step &step = journey_.steps()[next_];
        if (!begun_)
            begin(step, now);
        begun_ = true;
        if (!isDone(step, now)) {
            if (now >= deadline_)
                fail(step, reasonOfDelay(step));
            return false;
        }
        begun_ = false;
        next_++;
    }
    return true;
}

void JourneyPlayer::begin(const Step &step, TimePoint now) {
    deadline_ = now + limit_;
    answeredBefore_ = answeredLast_ = panel_.keypad.answered();
    switch (step.action) {
    case Journey::Action::tap:
        tapsLeft_ = step.count;
        panel_.keypad.tap(step.key);
        break;
    case Journey::Action::hold:
        panel_.keypad.press(step.key);
        break;
    case Journey::Action::release:
        panel_.keypad.release();
        break;
    case Journey::Action::wait:
        deadline_ = now + step.time;
        break;
    case Journey::Action::picture:
        takePicture(step);
        break;
    case Journey::Action::say:
        output_ << step.text << '\n' << std::flush;
        break;
    case Journey::Action::limit:
        limit_ = step.time;
        break;
    case Journey::Action::run:
        deadline_ = now + runLimit;
        output_.flush();
        shell_ =
            std::make_unique<ChildProcess>(std::vector<std::string>{"/bin/sh", "-c", step.text});
        break;
    case Journey::Action::expect:
    case Journey::Action::expectCursor:
        break;
    }
}

bool JourneyPlayer::isDone(const Step &step, TimePoint now) {
    const Display &display = panel_.display;
    switch (step.action) {
    case Journey::Action::tap:
        return isDoneTapping(step, now);
    case Journey::Action::hold:
        return isDoneHolding(step, now);
    case Journey::Action::release:
        return panel_.keypad.settled();
    case Journey::Action::wait:
        return now >= deadline_;
    case Journey::Action::expect:
        return display.visibleRow(0) == step.rows[0] && display.visibleRow(1) == step.rows[1];
    case Journey::Action::expectCursor:
        return display.cursorRow() == step.row && display.cursorColumn() == step.column &&
               display.cursorBlinking() == step.blinking;
    case Journey::Action::run:
        return isDoneRunning(step);
    case Journey::Action::picture:
    case Journey::Action::say:
    case Journey::Action::limit:
        break;
    }
    return true;
}

bool JourneyPlayer::isDoneTapping(const Step &step, TimePoint now) {
    if (!panel_.keypad.settled())
        return false;
    if (--tapsLeft_ == 0)
        return true;
    deadline_ = now + limit_;
    panel_.keypad.tap(step.key);
    return false;
}

bool JourneyPlayer::isDoneHolding(const Step &step, TimePoint now) {
    const unsigned long answered = panel_.keypad.answered();
    if (answered != answeredLast_)
        deadline_ = now + limit_;
    answeredLast_ = answered;
    return answered - answeredBefore_ >= static_cast<unsigned long>(step.count);
}

bool JourneyPlayer::isDoneRunning(const Step &step) {
    const std::optional<int> status = shell_->status();
    if (!status)
        return false;
    shell_.reset();
    if (*status != 0)
        fail(step, "the command ended with status " + std::to_string(*status));
    return true;
}

void JourneyPlayer::fail(const Step &step, const std::string &reason) const {
    throw std::runtime_error(journey_.place(step.line) + reason);
}

std::string JourneyPlayer::reasonOfDelay(const Step &step) const {
    const std::string shown = "shown:\n" + Picture(panel_.display).text();
    const auto cursor = [](int row, int column, bool blinking) {
        return "row " + std::to_string(row) + ", column " + std::to_string(column) +
               (blinking ? ", on" : ", off");
    };
    switch (step.action) {
    case Journey::Action::expect:
        return "the panel does not show what is expected\nwanted:\n" + Picture(step.rows).text() +
               shown;
    case Journey::Action::expectCursor:
        return "the cursor is not where it is expected\nwanted: " +
               cursor(step.row, step.column, step.blinking) + "\nis at:  " +
               cursor(panel_.display.cursorRow(), panel_.display.cursorColumn(),
                      panel_.display.cursorBlinking()) +
               "\n" + shown;
    case Journey::Action::run:
        return "the command is still running after 60 s";
    default:
        return "the program does not poll for keys\n" + shown;
    }
}

void JourneyPlayer::takePicture(const Step &step) {
    const Picture picture(panel_.display);
    output_ << picture.text() << std::flush;
    if (!pictures_)
        return;
    const std::filesystem::path path = *pictures_ / (step.text + ".svg");
    std::ofstream file(path, std::ios::binary);
    file << picture.svg();
    file.close();
    if (!file)
        fail(step, "cannot write " + path.string());
}

} // namespace emulator
