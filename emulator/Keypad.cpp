#include "Keypad.h"

namespace emulator {

void Keypad::press(Key key) {
    down_ = key;
    tapping_ = false;
    answer();
}

void Keypad::release() {
    down_.reset();
}

void Keypad::tap(Key key) {
    down_ = key;
    tapping_ = true;
    answer();
}

void Keypad::request(bool sinceAnswerRead) {
    waiting_ = true;
    if (!down_ && sinceAnswerRead)
        quietRequests_++;
    answer();
}

void Keypad::answer() {
    if (!waiting_ || !down_)
        return;
    const Key key = *down_;
    waiting_ = false;
    quietRequests_ = 0;
    answered_++;
    if (tapping_)
        down_.reset();
    send_(key);
}

} // namespace emulator
