#include "emulator/journey/Journey.h"

#include "emulator/base/complain.h"
#include "emulator/journey/words.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace emulator {

namespace {

constexpr std::size_t longestLine = 4096; // characters
constexpr std::size_t mostSteps = 100'000;

std::string_view trimmed(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    text.remove_suffix(text.size() - (text.find_last_not_of(blanks) + 1));
    return text;
}

// No more is read than a line may have, so that a device that never ends does not fill the memory.
bool getLine(std::istream &input, std::string &line) {
    line.resize(longestLine + 1);
    input.getline(line.data(), static_cast<std::streamsize>(line.size()));
    const auto count = static_cast<std::size_t>(input.gcount());
    const bool isTooLong = input.fail() && count == longestLine;
    if (isTooLong)
        throw std::invalid_argument("the line is too long");
    const bool hasLineFeed = !input.eof();
    line.resize(count - (count > 0 && hasLineFeed ? 1 : 0));
    return !input.fail();
}

// The text of a step that fails is printed, and must not control the terminal.
bool isText(std::string_view line) {
    if (!line.empty() && line.back() == '\r')
        line.remove_suffix(1); // some editors end lines with CR LF
    return masked(std::string(line)) == line;
}

// Some editors begin a text with this, which nobody sees.
void dropByteOrderMark(std::string &line) {
    constexpr std::string_view mark = "\xEF\xBB\xBF";
    if (line.compare(0, mark.size(), mark) == 0)
        line.erase(0, mark.size());
}

bool isAboutTheKeypad(const Action &action) {
    return std::holds_alternative<step::Tap>(action) || std::holds_alternative<step::Keys>(action);
}

const step::Scene *sceneOf(const Action &action) {
    const auto *inTest = std::get_if<TestAction>(&action);
    return inTest == nullptr ? nullptr : std::get_if<step::Scene>(inTest);
}

bool isSight(const TextLine &line) {
    return line.text.front() == '"' || line.text.front() == '*';
}

} // namespace

Journey::Journey(std::istream &input, std::string itsName, Stage itsStage)
    : name(std::move(itsName)), stage(itsStage) {
    std::vector<TextLine> scene; // nothing outside one
    TextLine line{0, ""};
    while (takeLine(input, line)) {
        if (line.text.empty() || line.text.front() == '#')
            continue;
        if (stage == Stage::test && firstWord(line) == "scene")
            readScene(std::exchange(scene, {line}));
        else if (!scene.empty())
            scene.push_back(line);
        else
            readLine(line);
    }
    readScene(scene);
    if (input.bad())
        throw std::invalid_argument(name + ": cannot be read");
    endListing();
    if (allSteps.empty())
        throw std::invalid_argument(name + ": there is no step in it");
}

bool Journey::takeLine(std::istream &input, TextLine &line) try {
    line.number++;
    std::string text;
    const bool isThere = getLine(input, text);
    if (line.number == 1)
        dropByteOrderMark(text);
    if (!isText(text))
        throw std::invalid_argument("this is not text: a control character is in it");
    line.text = trimmed(text);
    return isThere;
} catch (const std::invalid_argument &error) {
    throw std::invalid_argument(place(line.number) + error.what());
}

void Journey::readScene(const std::vector<TextLine> &scene) {
    for (const TextLine &line : expandTable(scene, [this](int number) { return place(number); }))
        readLine(line);
}

void Journey::readLine(const TextLine &line) {
    if (!isSight(line))
        endListing();
    try {
        isSight(line) ? readSight(line) : readStep(line);
    } catch (const std::invalid_argument &error) {
        throw std::invalid_argument(place(line.number) + error.what());
    }
}

void Journey::endListing() {
    if (listing && listing->isEmpty)
        throw std::invalid_argument(place(listing->line) + "no sights stand behind this step");
    listing.reset();
}

void Journey::readSight(const TextLine &line) {
    if (!listing)
        throw std::invalid_argument("a sight stands behind a walk or a hold");
    listing->isEmpty = false;
    addStep(line, listing->beforeEach);
    addStep(line, std::get<Action>(parseStep("expect " + line.text, stage)));
}

void Journey::readStep(const TextLine &line) {
    std::visit([&](const auto &parsed) { addStep(line, parsed); }, parseStep(line.text, stage));
}

void Journey::addStep(const TextLine &line, const step::Walk &walk) {
    const Action beforeEach = walk.isHold ? Action(step::Hold{walk.key, 1})
                                          : Action(step::Tap{walk.key, 1, std::nullopt});
    if (walk.letters.empty())
        listing = Listing{line.number, beforeEach, true};
    for (const char letter : walk.letters) {
        addStep(line, beforeEach);
        addStep(line, Action(step::ExpectLetter{letter}));
    }
}

void Journey::addStep(const TextLine &line, const step::Choose &choice) {
    Sight entry;
    entry.chosen = choice.entry;
    addStep(line, Action(step::Tap{Key::down, step::mostTapsUntil, entry}));
    addStep(line, Action(step::Tap{Key::enter, 1, std::nullopt}));
}

void Journey::addStep(const TextLine &line, const Action &action) {
    if (allSteps.size() == mostSteps)
        throw std::invalid_argument("there are too many steps");
    if (const auto *scene = sceneOf(action)) {
        sceneTitle = scene->title;
        isKeyDown = false;
    }
    // The one poll of a tap could not be told from those of the hold.
    if (isKeyDown && isAboutTheKeypad(action))
        throw std::invalid_argument("a key is still held: release it first");
    if (std::holds_alternative<step::Hold>(action))
        isKeyDown = true;
    if (std::holds_alternative<step::Release>(action))
        isKeyDown = false;
    allSteps.push_back({line.number, line.text, sceneTitle, action});
}

std::string Journey::place(const Step &step) const {
    return place(step.line) + (step.scene.empty() ? "" : "(" + step.scene + ") ");
}

std::string Journey::place(int line) const {
    return name + ":" + std::to_string(line) + ": ";
}

} // namespace emulator
