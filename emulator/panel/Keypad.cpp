#include "emulator/panel/Keypad.h"

namespace emulator {

void Keypad::switchOn() {
    release();
    isWaiting = false;
    quietRequests = wholePoll;
}

void Keypad::press(Key key) {
    keyDown = key;
    isTapping = false;
    answer();
}

void Keypad::release() {
    keyDown.reset();
}

void Keypad::tap(Key key) {
    keyDown = key;
    isTapping = true;
    answer();
}

void Keypad::request(bool sinceAnswerRead) {
    requestCount++;
    isWaiting = true;
    if (!keyDown && sinceAnswerRead)
        quietRequests++;
    answer();
}

void Keypad::answer() {
    if (!isWaiting || !keyDown)
        return;
    answersInARow = lastKey == *keyDown ? heldPolls() + 1 : 1;
    lastKey = *keyDown;
    isWaiting = false;
    quietRequests = 0;
    answerCount++;
    if (isTapping)
        keyDown.reset();
    send(lastKey);
}

} // namespace emulator
