#include "RunningProgram.h"

#include "runtime/LcdPanel.h"
#include "runtime/String.h"
#include "runtime/TextFile.h"
#include "runtime/runCommand.h"
#include "runtime/splitString.h"

#include <fstream>
#include <gtest/gtest-spi.h>

namespace {

std::string sentBy(const std::function<void(LcdPanel &)> &action) {
    world().sent.clear();
    action(*LcdPanel::instance());
    return world().sent;
}

} // namespace

FRESH_TEST(Runtime, TheLineIsConfiguredBeforeMain) {
    EXPECT_EQ(world().sent, "\xFE\x28\xFE\x28\xFE\x01\xFE\x02");
    EXPECT_EQ(world().writes, std::vector<std::size_t>(8, 1));
    const std::string stty = "start stty -F /dev/ttyS1 ";
    EXPECT_EQ(world().events,
              (std::vector<std::string>{
                  "start stty ispeed 2400 < /dev/ttyS1", "start stty raw < /dev/ttyS1",
                  stty + "-ignbrk -brkint -parmrk -inpck -istrip -inlcr -igncr -icrnl -iuclc"
                         " -ixon -ixany -ixoff -imaxbel ignpar",
                  stty + "-opost -olcuc -onlcr -ocrnl -onocr -onlret -ofill -ofdel nl0 cr0 tab0"
                         " bs0 vt0 ff0",
                  stty + "-parenb -crtscts -parodd -hupcl cread cs8 cstopb clocal",
                  stty + "-isig -icanon -iexten -echo noflsh"}));
}

FRESH_TEST(Runtime, TheCursorGoesWhereItIsSent) {
    const auto cursorAt = [](int row, int column) {
        return sentBy([&](LcdPanel &panel) { panel.setCursor(row, column); });
    };
    EXPECT_EQ(cursorAt(0, 45), "\xFE\xA7");
    EXPECT_EQ(cursorAt(1, 0), "\xFE\x41\xFE\x10");
    EXPECT_EQ(cursorAt(0, -1), "\xFE\x7F");
    EXPECT_EQ(cursorAt(2, 0), "");
    cursorAt(1, 39);
    EXPECT_EQ(world().display.cursorRow(), 1);
    EXPECT_EQ(world().display.cursorColumn(), 39);
    world().lineTakesBytes = false;
    world().writesTried = 0;
    EXPECT_EQ(LcdPanel::instance()->sendCommand(0x01), -1);
    EXPECT_EQ(world().writesTried, 1);
}

FRESH_TEST(Runtime, ATextIsTwoRowsOfSixteen) {
    const std::vector<std::tuple<std::string, std::string, int>> cases = {
        {"", "|", 0},
        {"one", "one|", 0},
        {"\nsecond\nthird", "|second", 0},
        {"a row too long by far\n12345678901234567890", "a row too long b|1234567890123456", 4},
    };
    LcdPanel &panel = *LcdPanel::instance();
    for (const auto &[text, rows, left] : cases) {
        world().writes.clear();
        EXPECT_EQ(panel.showText(text), left);
        EXPECT_EQ(world().shown(), rows);
        EXPECT_EQ(world().writes, (std::vector<std::size_t>{1, 1, 1, 1, 16, 1, 1, 1, 1, 16}));
    }
    EXPECT_EQ(world().display.hiddenCharacters(), 0U);
}

FRESH_TEST(Runtime, TheMarqueeGoesRoundBothWays) {
    LcdPanel &panel = *LcdPanel::instance();
    const std::string name = "abcdefghijklmnopqrst"; // 20 characters
    const std::string cycle = name + "   " + name;
    panel.showText("Title\n" + name);
    for (std::size_t step = 1; step <= 23; ++step) {
        panel.scrollMarqueeForward();
        EXPECT_EQ(world().display.visibleRow(1), cycle.substr(step % 23, 16));
        EXPECT_EQ(world().display.cursorColumn(), 15);
    }
    panel.scrollMarqueeBackward();
    EXPECT_EQ(world().display.visibleRow(1), " abcdefghijklmno");
    EXPECT_EQ(world().display.visibleRow(0), "Title           ");

    panel.showText("\n12345");
    panel.setMarqueeText("abc");
    EXPECT_EQ(sentBy([](LcdPanel &same) { same.scrollMarqueeForward(); }), "\xFE\x41\xFE\x10"
                                                                           "bc   abc\xFE\x10");
}

FRESH_TEST(Runtime, SplittingKeepsEmptyPiecesButForTheLast) {
    using Pieces = std::vector<QLX::String<char>>;
    EXPECT_EQ(splitString("x\ny\n ", "\n"), (Pieces{"x", "y", " "}));
    EXPECT_EQ(splitString("x\n\ny", "\n"), (Pieces{"x", "", "y"}));
    EXPECT_EQ(splitString("aaab", "aa"), (Pieces{"", "ab"}));
    EXPECT_EQ(splitString("", ","), (Pieces{""}));
    EXPECT_EQ(splitString("x,y", ""), (Pieces{"x,y"}));
}

FRESH_TEST(Runtime, AllOutputIsCaptured) {
    const std::string longLine(1000, 'x');
    world().appliance.act({"prints", "many", "a\n" + longLine + "\n\nno end"});
    EXPECT_EQ(runCommand("many", true), "a\n" + longLine + "\n\nno end");
    EXPECT_EQ(runCommand("later", false), "");
    EXPECT_EQ(world().events.back(), "start `later` &");
    world().shellWorks = false;
    EXPECT_EQ(runCommand("many", true), "ERROR");
}

FRESH_TEST(Runtime, AFileIsReadLineByLineWhateverItHolds) {
    const std::string path = "/etc/resolv.conf", longLine(100'000, 'x');
    const auto linesOf = [&](const std::string &contents) {
        world().appliance.act({"file", path, contents});
        TextFile file(path.c_str());
        std::vector<std::string> lines;
        while (const auto line = file.nextLine())
            lines.push_back(*line);
        EXPECT_EQ(file.nextLine(), std::nullopt);
        return lines;
    };
    using Lines = std::vector<std::string>;
    EXPECT_EQ(linesOf(""), Lines{});
    EXPECT_EQ(linesOf("a\n\n\n"), (Lines{"a", "", ""}));
    EXPECT_EQ(linesOf("a\r\n\xFF\nno line feed"), (Lines{"a\r", "\xFF", "no line feed"}));
    EXPECT_EQ(linesOf(std::string("a\0b\n\0", 5)),
              (Lines{std::string("a\0b", 3), std::string("\0", 1)}));
    EXPECT_EQ(linesOf(longLine + "\n" + longLine), (Lines{longLine, longLine}));

    world().cutFiles = {path};
    EXPECT_EQ(linesOf("a\nhalf a li"), Lines{"a"});
    world().cutFiles.clear();
    world().directories = {path};
    EXPECT_TRUE(TextFile(path.c_str()).isOpen());
    EXPECT_EQ(linesOf("a\n"), Lines{});
    world().directories.clear();
    world().appliance.act({"remove", path});
    EXPECT_FALSE(TextFile(path.c_str()).isOpen());
    EXPECT_EQ(TextFile(path.c_str()).nextLine(), std::nullopt);
    for (const char *other : {"/etc/resolv.conf", "/proc/sys/kernel/hostname"})
        EXPECT_NONFATAL_FAILURE(const std::ifstream file(other), "the machine's own file");
}

FRESH_TEST(Runtime, TrimmingStripsBothEnds) {
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
