#include "emulator/operators/Finger.h"

#include <algorithm>

namespace emulator {

namespace {

constexpr std::chrono::milliseconds tapTime{400}; // of a slow finger
constexpr std::size_t mostWaiting = 4;

} // namespace

void Finger::tap(Key key, TimePoint now) {
    const bool endsHold = down && down->manner == Manner::hold;
    const bool isSame = endsHold && down->key == key;
    if (endsHold)
        lift();
    if (!isSame && waiting.size() < mostWaiting)
        waiting.push_back({key, now, keypad.requests()});
    look(now);
}

void Finger::hold(Key key) {
    const bool endsHold = down && down->manner == Manner::hold && down->key == key;
    lift();
    waiting.clear();
    if (!endsHold)
        putDown(key, Manner::hold, {});
}

void Finger::press(Key key, TimePoint now) {
    lift();
    waiting.clear();
    putDown(key, Manner::press, now);
}

void Finger::release(TimePoint now) {
    if (!down || down->manner != Manner::press)
        return;
    const bool isAnswered = keypad.answered() != down->answersBefore;
    const Down pressed = *down;
    lift();
    // A key that came up before the program could ask for it counts as a tap.
    if (!isAnswered && now - pressed.since < tapTime) {
        putDown(pressed.key, Manner::tap, pressed.since);
    }
}

void Finger::letGo() {
    if (down && down->manner == Manner::hold)
        lift();
}

void Finger::look(TimePoint now) {
    if (down && down->manner == Manner::tap) {
        if (!keypad.down())
            down.reset();
        else if (now >= down->since + tapTime)
            lift();
    }
    const auto isForgotten = [&](const Typed &typed) {
        return now >= typed.time + tapTime && keypad.requests() == typed.requestsBefore;
    };
    waiting.erase(std::remove_if(waiting.begin(), waiting.end(), isForgotten), waiting.end());
    if (!down && !waiting.empty() && keypad.settled()) {
        const Key key = waiting.front().key;
        waiting.pop_front();
        putDown(key, Manner::tap, now);
    }
}

std::optional<TimePoint> Finger::wakeAt() const {
    std::optional<TimePoint> wake;
    if (down && down->manner == Manner::tap)
        wake = down->since + tapTime;
    for (const Typed &typed : waiting) {
        if (keypad.requests() == typed.requestsBefore)
            wake = std::min(wake.value_or(TimePoint::max()), typed.time + tapTime);
    }
    return wake;
}

void Finger::putDown(Key key, Manner manner, TimePoint now) {
    down = Down{key, manner, now, keypad.answered()};
    manner == Manner::tap ? keypad.tap(key) : keypad.press(key);
}

void Finger::lift() {
    if (down)
        keypad.release();
    down.reset();
}

} // namespace emulator
