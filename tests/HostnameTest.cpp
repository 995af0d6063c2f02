#include "Operator.h"

#include "runtime/String.h"

namespace {

const std::string prompt = "Enter Hostname:|", page = "Hostname:|";
const std::string confirm = "ESC   - Cancel|ENTER - Apply";
const std::string alphabet = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";

Operator atTheName(const std::string &hostname) {
    standardAppliance(world());
    world().hostname = hostname;
    Operator person;
    person.waitForPage("Hostname:");
    return person;
}

char underCursor() {
    const auto &display = world().display;
    return display.wholeRow(1)[static_cast<std::size_t>(display.cursorColumn())];
}

std::vector<std::string> started() {
    return world().commands("start ");
}

} // namespace

TEST(Hostname, TheAlphabetIsWalkedBothWaysAndWrapsAndRests) {
    Operator person = atTheName("a\n");
    person.press(keyEnter);
    for (std::size_t k = 1; k <= alphabet.length(); ++k) {
        person.press(keyDown);
        EXPECT_EQ(underCursor(), alphabet[k % alphabet.length()]);
    }
    for (std::size_t k = alphabet.length(); k-- > 0;) {
        person.press(keyUp);
        EXPECT_EQ(underCursor(), alphabet[k]);
    }
    walk(person, {{"d7", prompt + "d", "1,0"}, // the first poll, the sixth and the seventh
                  {"u6", prompt + "b", "1,0"},
                  {"eu", prompt + "b9", "1,1"},
                  {"x", prompt + "b", "1,0"},
                  {"ed", prompt + "ba", "1,1"},
                  {"xx", page + "a"}});
}

TEST(Hostname, NamesOfEveryShapeAreTakenFromTheSystem) {
    struct Case {
        std::string name, row, cursor, afterUp, afterDown;
    };
    const std::string forty = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMN";
    const std::vector<Case> cases = {
        {"\n", "", "1,0", "-", "a"},
        {"", "", "1,0", "-", "a"},
        {"h.\n", "h.", "1,1", "h-", "ha"},
        {"a b\nc\n", "a b", "1,4", "a b b",
         "a b d"}, // the cursor is on a character that is not shown
        {"sixteencharacter\n", "sixteencharacter", "1,15", "sixteencharacteq", "sixteencharactes"},
        {forty.substr(0, 17) + "\n", "bcdefghijklmnopq", "1,15", "bcdefghijklmnopp",
         "bcdefghijklmnopr"},
        {forty + "\n", "yzABCDEFGHIJKLMN", "1,15", "yzABCDEFGHIJKLMM", "yzABCDEFGHIJKLMO"},
        {forty + forty.substr(0, 24) + "\n", "yzABCDEFGHIJKLMN", "1,15", "yzABCDEFGHIJKLMM",
         "yzABCDEFGHIJKLMO"},
    };
    for (const auto &test : cases) {
        for (const bool up : {true, false}) {
            inFreshProgram([&] {
                Operator person = atTheName(test.name);
                walk(person, {{"e", prompt + test.row, test.cursor}});
                person.press(up ? keyUp : keyDown);
                EXPECT_EQ(Operator::sees(), prompt + (up ? test.afterUp : test.afterDown));
            });
        }
    }
}

TEST(Hostname, TheRowFollowsTheCursorPastItsEndAndBackAndFortyIsTheLimit) {
    Operator person = atTheName("abcdefghijklmno\n");
    walk(person,
         {{"e", prompt + "abcdefghijklmno", "1,14"}, {"ed", prompt + "abcdefghijklmnoa", "1,15"}});
    std::string name = "abcdefghijklmnoa";
    while (name.length() < 40) {
        person.press(keyEnter);
        EXPECT_EQ(Operator::cursor(), "1,15");
        person.press(keyDown);
        name += underCursor();
        EXPECT_EQ(underCursor(), 'a');
        EXPECT_EQ(world().display.visibleRow(1), name.substr(name.length() - 16));
    }
    const std::string atTheLimit = Operator::sees();
    walk(person, {{"e", atTheLimit, "1,15"}, {"e6", confirm}, {"e", "Rebooting|appliance..."}});
    EXPECT_EQ(started(),
              std::vector<std::string>{"`" + applyScript + "hostname --hostname " + name + "` &"});
    EXPECT_EQ(world().display.hiddenCharacters(), 0U);
}

TEST(Hostname, EscapeErasesStepsBackAndScrollsTheRowBack) {
    Operator person = atTheName("abcdefghijklmnopqrs\n");
    walk(person, {{"e", prompt + "defghijklmnopqrs", "1,15"},
                  {"xx", prompt + "bcdefghijklmnopq", "1,15"},
                  {"ed", prompt + "cdefghijklmnopqa", "1,15"},
                  {"xxx", prompt + "abcdefghijklmno", "1,14"},
                  {"x2", prompt + "abcdefghijklmn", "1,13"}});
}

TEST(Hostname, LongPressesFinishOrEraseAndShortOnesLeaveOrGoOn) {
    Operator person = atTheName("box\n");
    walk(person,
         {{"e5", prompt + "box", "1,2"}, // the page reacts to five polls, the editor to none
          {"x5", prompt + "bo", "1,1"},
          {"x9", prompt, "1,0"},
          {"e", confirm},
          {"x", page + "box"},
          {"e6", confirm}, // held on from the page, Enter finishes
          {"x", page + "box"},
          {"e", prompt + "box", "1,2"},
          {"xxd", prompt + "c", "1,0"},
          {"x9", page + "box"}});
    EXPECT_TRUE(started().empty());
}

TEST(Hostname, ABadNameIsRefusedForTwoSecondsAndAGoodOneAppliedOnce) {
    Operator person = atTheName("box\n");
    const std::vector<std::pair<std::string, std::string>> refusals = {
        {"ex6", "Error|Empty Hostname"},
        {"exxuuue", "Error|Invalid Hostname"}, // 9
        {"exxuue", "Error|Invalid Hostname"},  // -
        {"eedue", "Error|Invalid Hostname"},   // box-
    };
    for (const auto &[keys, error] : refusals) {
        std::string shown;
        walk(person, {{keys + "e", confirm}});
        world().duringPause = [&] { shown = Operator::sees(); };
        world().pauses.clear();
        person.press(keyEnter);
        EXPECT_EQ(shown, error);
        EXPECT_EQ(world().pauses, std::vector<long long>{2'000'000});
        walk(person, {{"", prompt + "box", "1,2"}, {"xxx", page + "box"}});
    }
    walk(person, {{"eeuee", confirm}}); // box9
    person.poll(keyEnter);
    EXPECT_EQ(Operator::sees(), "Rebooting|appliance...");
    person.poll(keyEnter);
    person.wait(100);
    EXPECT_EQ(Operator::sees(), "Rebooting|appliance...");
    EXPECT_EQ(started(),
              std::vector<std::string>{"`" + applyScript + "hostname --hostname box9` &"});
    walk(person, {{"e", prompt + "box", "1,2"}}); // there is no name any more: an error, and back
    EXPECT_EQ(started().size(), 1U);
}

TEST(Hostname, TrimmingStripsBothEndsAndGivesBackWhatIsLeft) {
    using Text = QLX::String<char>;
    Text text = "  a b  ";
    EXPECT_EQ(Text(text).trimRight(" "), "  a b");
    EXPECT_EQ(Text(text).trimLeft(" a"), "b  ");
    EXPECT_EQ(&text.trim(), &text);
    EXPECT_EQ(text, "a b");
    Text blanks = "   ";
    EXPECT_THROW(Text(blanks).trimLeft(" "), std::out_of_range);
    EXPECT_EQ(blanks.trim(), "");
    EXPECT_EQ(blanks.trimLeft(" ") + blanks.trimRight(" "), "");
}
