#pragma once

#include "emulator/panel/Key.h"

#include <functional>
#include <optional>

namespace emulator {

/// The panel's four keys, of which one is down at a time, and its answers to key requests.
///
/// A request is answered while a key is down. Without one it waits for a key to go down; the next
/// request takes its place. The panel never answers that no key is down, and it forgets a key that
/// came up before it was asked for.
class Keypad {
  public:
    using Send = std::function<void(Key)>;

    /// `send` is called with the key for each answer.
    explicit Keypad(Send toSend) : send(std::move(toSend)) {}

    /// As when the panel has just been switched on: no key is down, and none has been asked for.
    void switchOn();
    /// Puts a key down until `release`. A key that was down comes up.
    void press(Key key);
    void release();
    /// Puts a key down for exactly one answer.
    void tap(Key key);

    /// The program has asked for a key. `sinceAnswerRead` tells whether it did so after it had read
    /// the last answer: a request that it has given up may still be answered, and that answer is
    /// then read by the next poll, whose request was already on the line.
    void request(bool sinceAnswerRead);

    [[nodiscard]] std::optional<Key> down() const { return keyDown; }
    /// Requests received so far, and those of them that were answered.
    [[nodiscard]] unsigned long requests() const { return requestCount; }
    [[nodiscard]] unsigned long answered() const { return answerCount; }
    /// The key that was answered last; up before the first answer.
    [[nodiscard]] Key lastAnswer() const { return lastKey; }
    /// How many polls in a row, as the program counts them, were answered with that key; 0 when the
    /// last one was not.
    [[nodiscard]] unsigned long heldPolls() const {
        return quietRequests >= wholePoll ? 0 : answersInARow;
    }
    /// True when no key is down and, since the last answer was read, a whole poll has gone by
    /// without one: only then does the program take the next answer for a new press.
    [[nodiscard]] bool settled() const { return !keyDown && quietRequests >= wholePoll; }

  private:
    // That a poll without a key is over is known when the request of the next poll comes.
    static constexpr unsigned long wholePoll = 2;

    void answer();

    Send send;
    std::optional<Key> keyDown;
    Key lastKey = Key::up;
    bool isTapping = false;
    bool isWaiting = false; // a request is
    unsigned long requestCount = 0;
    unsigned long answerCount = 0;
    unsigned long answersInARow = 0;
    unsigned long quietRequests = wholePoll;
};

} // namespace emulator
