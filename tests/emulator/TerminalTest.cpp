// A person at a terminal: what the bytes of the terminal mean, and what typing does to the keypad.
#include "emulator/operators/Finger.h"
#include "emulator/terminal/TerminalKeys.h"

#include <gtest/gtest.h>

using namespace emulator;
using namespace std::chrono_literals;

namespace {

// The events as letters: the key's initial, in capitals for a hold; M and m for the mouse, Q, and a
// full stop for any other character.
std::string letters(const std::vector<TerminalKeys::Event> &events) {
    std::string text;
    for (const auto &event : events) {
        if (const auto *tap = std::get_if<TerminalKeys::Tap>(&event))
            text += traits(tap->key).letter;
        else if (const auto *hold = std::get_if<TerminalKeys::Hold>(&event))
            text += static_cast<char>(std::toupper(traits(hold->key).letter));
        else
            text += "..MmQ."[event.index()];
    }
    return text;
}

TEST(TerminalKeys, KnowsKeysAndTheMouseAndPassesOverEverythingElse) {
    const std::vector<std::pair<std::string, std::string>> cases{
        {"\033[A\033OB\r\n", "udee"},
        {"udex", "UDEX"},
        {"\033[1;2A\033[b\033[13;2u\033[27;2;27~", "UDEX"},
        {"\033[<0;35;2M\033[<0;35;2m", "Mm"},
        {"q?", "Q."},
        {"\033[I\033[O\033[5~\033[<64;1;1M\033q\033[1;5C", ""},
        {"\033\033[A\033[A\033\033\033[A", "ux"}, // with Alt, as some terminals send it
        {"\033[200~q\033[Ad\r\033\033\033d\033[201~u", "U"},
        {"\033\033]11;rgb:dddd/d\a\033Pd\033\\\033]d\033[B", "xd"},
        {"\033[" + std::string(40, '1') + "A", ""},
    };
    for (const auto &[bytes, meaning] : cases)
        EXPECT_EQ(letters(TerminalKeys().take(bytes, {})), meaning) << bytes;
}

TEST(TerminalKeys, WaitsForTheRestOfASequenceButNotForEver) {
    TerminalKeys keys;
    const TimePoint now;
    EXPECT_EQ(letters(keys.take("\033", now)), "");
    EXPECT_EQ(letters(keys.look(now + 149ms)), "");
    EXPECT_EQ(letters(keys.look(now + 150ms)), "x");
    EXPECT_EQ(letters(keys.take("\033\033", now)), "");
    EXPECT_EQ(letters(keys.look(now + 150ms)), "xx");
    EXPECT_EQ(letters(keys.take("\033", now)), "");
    EXPECT_EQ(letters(keys.take("[<0;35", now + 140ms)), "");
    EXPECT_EQ(letters(keys.take(";2M", now + 280ms)), "M");
    for (const auto &[broken, time] : {std::pair("\033[<", 250ms), std::pair("\033]11", 250ms),
                                       std::pair("\033[200~d\033", 3000ms)}) {
        EXPECT_EQ(letters(keys.take(broken, now)), "");
        EXPECT_EQ(letters(keys.take("q", now + time)), "Q");
    }
    EXPECT_FALSE(keys.wakeAt());
}

struct Hand {
    // A poll, 0.1 s after the one before: its answer's letter, or a full stop.
    char poll() {
        now += 100ms;
        keypad.request(true);
        finger.look(now);
        return std::exchange(answer, '.');
    }
    std::string polls(int count) {
        std::string answers;
        while (count-- > 0)
            answers += poll();
        return answers;
    }

    char answer = '.';
    Keypad keypad{[this](Key key) { answer = traits(key).letter; }};
    Finger finger{keypad};
    TimePoint now;
};

TEST(Finger, TypesEachKeyAsAPressOfItsOwn) {
    Hand hand;
    for (const Key key : {Key::down, Key::down, Key::enter})
        hand.finger.tap(key, hand.now);
    EXPECT_EQ(hand.polls(9), "d.d.e....");
}

TEST(Finger, IsForgottenWhenNobodyAsksForItsKeys) {
    Hand hand;
    for (int k = 0; k < 3; k++)
        hand.finger.tap(Key::enter, hand.now);
    hand.now += 500ms; // as while changes are applied
    hand.finger.look(hand.now);
    EXPECT_FALSE(hand.keypad.down());
    EXPECT_EQ(hand.polls(5), ".....");
}

TEST(Finger, HoldsUntilAnyOtherKeyAndAClickIsNotLost) {
    Hand hand;
    hand.finger.hold(Key::up);
    EXPECT_EQ(hand.polls(2), "uu");
    hand.finger.hold(Key::up);
    EXPECT_EQ(hand.polls(2), "..");
    hand.finger.hold(Key::up);
    hand.finger.tap(Key::up, hand.now); // only ends the hold
    EXPECT_EQ(hand.polls(3), "u..");    // which was asked for already
    hand.finger.hold(Key::up);
    hand.finger.press(Key::enter, hand.now);
    EXPECT_EQ(hand.polls(2), "ee");
    hand.finger.release(hand.now);
    hand.finger.tap(Key::down, hand.now);
    EXPECT_EQ(hand.polls(5), ".d...");
    for (const auto &[time, answers] : {std::pair(399ms, "x.."), std::pair(400ms, "...")}) {
        hand.finger.hold(Key::up);
        EXPECT_EQ(hand.polls(1), "u"); // the program asks again at the next poll
        hand.finger.press(Key::escape, hand.now);
        hand.finger.release(hand.now + time);
        EXPECT_EQ(hand.polls(3), answers);
    }
}

} // namespace
