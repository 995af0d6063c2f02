#include "emulator/journey/StepTable.h"

#include "emulator/base/Number.h"
#include "emulator/base/helpEntry.h"
#include "emulator/journey/ApplianceVerbs.h"
#include "emulator/journey/words.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Font.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace emulator {

namespace {

constexpr int mostPolls = 100'000;
constexpr int mostRepeats = 255; // of a byte

[[noreturn]] void reject(const std::string &reason) {
    throw std::invalid_argument(reason);
}

// What follows a step's name: words, which are taken one after the other, or the rest of the line.
class Arguments {
  public:
    explicit Arguments(std::string_view text) : rest(text) { skipBlanks(rest); }

    bool isEmpty() const { return isEndOfWords(rest); }
    bool nextIs(std::string_view word) const {
        return std::string_view(rest).substr(0, rest.find_first_of(blanks)) == word;
    }
    bool nextIsNumber() const {
        return !rest.empty() && rest.front() >= '0' && rest.front() <= '9';
    }

    std::string take() {
        if (isEmpty())
            reject("");
        return unquoted(takeWord(rest));
    }
    void take(std::string_view word) {
        if (!nextIs(word))
            reject("");
        take();
    }
    std::string takeRest() { return std::string(std::exchange(rest, {})); }

    int takeInteger(int least, int most, const std::string &what) {
        return parseNumber(take(), least, most, what);
    }
    Clock::duration takeSeconds(double least = 0) {
        return seconds(parseNumber(take(), least, longestLimit, "a number of seconds"));
    }
    int takePolls() { return takeInteger(1, mostPolls, "a number of polls"); }

    Key takeKey() {
        const std::string word = take();
        const auto *found = std::find_if(keys.begin(), keys.end(),
                                         [&](const KeyTraits &key) { return key.name == word; });
        if (found == keys.end())
            reject("'" + word + "' is not a key: up, down, enter or escape");
        return found->key;
    }

    // A text that can be seen on the panel, if there is any in it.
    std::string takeVisible(std::size_t most) {
        std::string text = take();
        if (text.size() > most)
            reject("\"" + text + "\" is longer than a row");
        if (!std::all_of(text.begin(), text.end(), isPrintable))
            reject("\"" + text + "\" can never be seen: the panel shows only printable ASCII");
        return text;
    }
    std::string takeRow() {
        std::string row = takeVisible(Display::visibleColumns);
        row.resize(Display::visibleColumns, ' ');
        return row;
    }
    std::string takeEntry() {
        const std::string entry = takeVisible(Display::visibleColumns - 1); // behind the marker
        if (entry.empty())
            reject("an entry of a list is not empty");
        return entry;
    }
    std::string takeLetters() {
        const std::string letters = takeVisible(std::string::npos);
        if (letters.empty())
            reject("there are no letters to walk through");
        return letters;
    }
    Display::Place takePlace() {
        const int row = takeInteger(0, Display::rowCount - 1, "a row");
        return {row, takeInteger(0, Display::columns - 1, "a column")};
    }
    Sight takeSight() {
        Sight sight;
        if (nextIs("chosen")) {
            take();
            sight.chosen = takeEntry();
            return sight;
        }
        if (nextIs("*")) {
            take();
            if (isEmpty())
                reject("* alone is always seen: give the other row, or where the cursor is");
        } else {
            sight.row0 = takeRow();
        }
        if (!isEmpty() && !nextIs("at"))
            sight.row1 = takeRow();
        if (!isEmpty()) {
            take("at");
            sight.cursor = takePlace();
        }
        return sight;
    }

    // Bytes in hexadecimal, to the end of the line; 20*40 is the byte 20 forty times.
    std::string takeBytes() {
        std::string bytes;
        while (!isEmpty()) {
            const std::string word = take();
            const std::size_t star = std::min(word.find('*'), word.size());
            const int times = star == word.size()
                                  ? 1
                                  : parseNumber(word.substr(star + 1), 1, mostRepeats, "a count");
            bytes.append(static_cast<std::size_t>(times),
                         static_cast<char>(parseByte(word.substr(0, star))));
        }
        return bytes;
    }

  private:
    std::string_view rest;
};

ParsedStep parseTap(Arguments &words) {
    step::Tap tap{words.takeKey(), 1, std::nullopt};
    const bool isCounted = words.nextIsNumber();
    if (isCounted)
        tap.count = words.takeInteger(1, mostPolls, "a number of taps");
    if (words.isEmpty())
        return tap;
    words.take("until");
    tap.until = words.takeSight();
    if (!isCounted)
        tap.count = step::mostTapsUntil;
    return tap;
}

Key keyOfLetter(char letter) {
    for (const KeyTraits &key : keys) {
        if (key.letter == letter)
            return key.key;
    }
    reject(std::string("'") + letter + "' is not the letter of a key: u, d, e or x");
}

ParsedStep parseKeys(Arguments &words) {
    constexpr std::string_view digits = "0123456789";
    step::Keys sequence;
    do {
        const std::string word = words.take();
        for (std::size_t at = 0; at < word.size();) {
            Stroke stroke{keyOfLetter(word[at++]), 1};
            const std::size_t end = std::min(word.find_first_not_of(digits, at), word.size());
            if (end > at)
                stroke.polls =
                    parseNumber(word.substr(at, end - at), 1, mostPolls, "a number of polls");
            at = end;
            sequence.strokes.push_back(stroke);
        }
    } while (!words.isEmpty());
    return sequence;
}

ParsedStep parseHold(Arguments &words) {
    const Key key = words.takeKey();
    if (words.isEmpty())
        return step::Walk{key, true, ""};
    return step::Hold{key, words.takePolls()};
}

ParsedStep parseWalk(Arguments &words) {
    const Key key = words.takeKey();
    return step::Walk{key, false, words.isEmpty() ? "" : words.takeLetters()};
}

ParsedStep parseChoose(Arguments &words) {
    return step::Choose{words.takeEntry()};
}

ParsedStep parseWith(Arguments &) {
    reject("a table stands in a scene, behind its title");
}

ParsedStep parseRelease(Arguments &) {
    return step::Release{};
}

ParsedStep parseWait(Arguments &words) {
    return step::Wait{words.takeSeconds()};
}

ParsedStep parseExpect(Arguments &words) {
    return step::Expect{words.takeSight()};
}

ParsedStep parseExpectCursor(Arguments &words) {
    step::ExpectCursor cursor{words.takePlace(), false};
    const std::string state = words.take();
    if (state != "on" && state != "off")
        reject("'" + state + "' is not on or off");
    cursor.blinking = state == "on";
    return cursor;
}

ParsedStep parsePicture(Arguments &words) {
    const std::string name = words.take();
    const bool isPlain =
        name.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                               "0123456789-_.") == std::string::npos;
    if (!isPlain || name.empty() || name.front() == '.')
        reject("'" + name + "' is not a name for a picture: use letters, digits, - _ and .");
    return step::TakePicture{name};
}

ParsedStep parseSay(Arguments &words) {
    return step::Say{words.takeRest()};
}

ParsedStep parseLimit(Arguments &words) {
    return step::Limit{words.takeSeconds(shortestLimit)};
}

ParsedStep parseRun(Arguments &words) {
    step::Run run{words.takeRest()};
    if (run.command.empty())
        reject("");
    return run;
}

ParsedStep parseAppliance(Arguments &words) {
    step::Appliance appliance;
    do {
        appliance.words.push_back(words.take());
    } while (!words.isEmpty());
    checkVerb(appliance.words);
    return appliance;
}

ParsedStep parseScene(Arguments &words) {
    return TestAction(step::Scene{words.takeRest()});
}

ParsedStep parsePrints(Arguments &words) {
    step::Prints prints{words.take(), ""};
    prints.output = words.take();
    return TestAction(prints);
}

ParsedStep parseAnswer(Arguments &words) {
    return TestAction(step::Answer{words.takeBytes()});
}

ParsedStep parseExpectSent(Arguments &words) {
    return TestAction(step::ExpectSent{words.takeBytes()});
}

ParsedStep parseExpectPause(Arguments &words) {
    step::ExpectPause pause{words.takeSeconds(), {}};
    pause.sight = words.takeSight();
    return TestAction(pause);
}

ParsedStep parseExpectRun(Arguments &words) {
    step::ExpectRun run{words.take(), {}};
    run.sight = words.takeSight();
    return TestAction(run);
}

struct StepKind {
    std::string_view name;
    std::string_view arguments;
    std::string_view help; // lines, separated by line feeds
    bool needsTest;        // it can be played in a test only
    ParsedStep (*parse)(Arguments &);
};

constexpr std::array stepKinds{
    StepKind{"tap", "KEY [N] [until SIGHT]",
             "press KEY for exactly one key request, and wait until a whole poll\n"
             "has gone by without it; do this N times. With until, stop as soon\n"
             "as the panel shows SIGHT, and fail after N taps (default: 100)",
             false, parseTap},
    StepKind{"keys", "LETTERS...",
             "tap many keys: u, d, e and x stand for up, down, enter and escape.\n"
             "With a number behind its letter, a key is held for that many key\n"
             "requests",
             false, parseKeys},
    StepKind{"walk", "KEY [\"LETTERS\"]",
             "tap KEY once for each of the letters, and expect that letter at the\n"
             "cursor. Without letters: tap KEY once for each of the next lines that\n"
             "begin with a quote or *, and expect the SIGHT that stands there",
             false, parseWalk},
    StepKind{"choose", "\"ENTRY\"", "tap Down until this entry of a list is chosen, and then Enter",
             false, parseChoose},
    StepKind{"hold", "KEY [POLLS]",
             "press KEY and wait until it has answered that many key requests;\n"
             "the key stays down, and another hold goes on counting. Without POLLS:\n"
             "hold KEY for one poll more before each SIGHT in the next lines",
             false, parseHold},
    StepKind{"release", "",
             "let the key come up, and wait until a whole poll has gone by without\n"
             "it",
             false, parseRelease},
    StepKind{"wait", "SECONDS", "let this time pass", false, parseWait},
    StepKind{"expect", "SIGHT", "wait until the panel shows SIGHT", false, parseExpect},
    StepKind{"expect-cursor", "ROW COLUMN on|off",
             "wait until the cursor is there, and blinks or does not", false, parseExpectCursor},
    StepKind{"picture", "NAME", "print what the display shows, with v or ^ at a blinking cursor",
             false, parsePicture},
    StepKind{"say", "TEXT", "print the rest of the line", false, parseSay},
    StepKind{"limit", "SECONDS", "let each step from here on wait so long for the panel", false,
             parseLimit},
    StepKind{"run", "COMMAND",
             "have /bin/sh run the rest of the line, which has to end with status 0\n"
             "within 60 seconds; whatever it leaves running is ended",
             false, parseRun},
    StepKind{"appliance", "VERB...",
             "change something at the appliance that the program runs on, or check\n"
             "something there, with one of the verbs below",
             false, parseAppliance},
    StepKind{"scene", "TITLE",
             "set up a fresh appliance, whose program starts at the next step that is\n"
             "not about the appliance",
             true, parseScene},
    StepKind{"with", "WORD...",
             "stands in a scene, and gives it a table: the scene is played once for\n"
             "each such line, and $1 to $9 in its other lines stand for these words",
             true, parseWith},
    StepKind{"prints", "\"COMMAND\" \"OUTPUT\"",
             "from here on let this command line of the program print this", true, parsePrints},
    StepKind{"answer", "HEX...",
             "let the program read these bytes in place of the panel's next answer;\n"
             "20*40 means the byte 20 forty times",
             true, parseAnswer},
    StepKind{"expect-sent", "[HEX...]",
             "check that, apart from key requests, just these bytes have been sent\n"
             "since the last step that pressed a key",
             true, parseExpectSent},
    StepKind{"expect-pause", "SECONDS SIGHT",
             "check how long the next pause was in which no key was read, and what\n"
             "the panel showed in the meantime",
             true, parseExpectPause},
    StepKind{"expect-run", "\"COMMAND\" SIGHT",
             "check the command line of the configuration script's next run, and what\n"
             "the panel showed in the meantime",
             true, parseExpectRun},
};

std::string usage(const StepKind &kind) {
    return std::string(kind.name) + (kind.arguments.empty() ? "" : " ") +
           std::string(kind.arguments);
}

} // namespace

ParsedStep parseStep(std::string_view line, Stage stage) {
    const std::string_view name = line.substr(0, line.find_first_of(blanks));
    const auto *kind = std::find_if(stepKinds.begin(), stepKinds.end(),
                                    [&](const StepKind &each) { return each.name == name; });
    if (kind == stepKinds.end())
        reject("'" + std::string(name) + "' is not a step");
    if (kind->needsTest && stage != Stage::test)
        reject("'" + std::string(name) +
               "' can be used only in the program's tests, in virtual time");
    Arguments arguments(line.substr(name.size()));
    std::string complaint;
    try {
        ParsedStep step = kind->parse(arguments);
        if (arguments.isEmpty())
            return step;
    } catch (const std::invalid_argument &error) {
        complaint = error.what();
    }
    reject(complaint.empty() ? "usage: " + usage(*kind) : complaint);
}

std::string stepsHelp(Stage stage) {
    constexpr std::size_t indent = 21;
    std::string text;
    for (const StepKind &kind : stepKinds) {
        if (kind.needsTest == (stage == Stage::test))
            text += helpEntry("  " + usage(kind), kind.help, indent);
    }
    return text + (stage == Stage::panel ? "The appliance's verbs are:\n" + verbsHelp() : "");
}

} // namespace emulator
