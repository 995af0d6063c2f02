#include "Operator.h"

#include "runtime/String.h"

TEST(Hostname, TheAlphabetIsWalkedBothWaysAndWraps) {
    const std::string alphabet = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-";
    standardAppliance(world());
    world().hostname = "a\n";
    Operator person;
    person.waitForPage("Hostname:");
    person.press(keyEnter);
    for (std::size_t k = 1; k <= alphabet.length(); ++k) {
        person.press(keyDown);
        EXPECT_EQ(world().display.visibleRow(1)[0], alphabet[k % alphabet.length()]);
    }
    for (std::size_t k = alphabet.length(); k-- > 0;) {
        person.press(keyUp);
        EXPECT_EQ(world().display.visibleRow(1)[0], alphabet[k]);
    }
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
