#include "emulator/journey/Journey.h"

#include "emulator/panel/Font.h"

#include <algorithm>
#include <stdexcept>

namespace emulator {

namespace {

constexpr std::size_t longestLine = 4096; // characters
constexpr std::size_t mostSteps = 100'000;
constexpr std::string_view blanks = " \t\r";

std::string_view trimmed(std::string_view text) {
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    text.remove_suffix(text.size() - (text.find_last_not_of(blanks) + 1));
    return text;
}

// No more is read than a line may have, so that a device that never ends does not fill the memory.
bool readLine(std::istream &input, std::string &line) {
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
    return std::all_of(line.begin(), line.end(), [](char c) {
        return static_cast<unsigned char>(c) >= ' ' || blanks.find(c) != std::string_view::npos;
    });
}

bool isAboutTheKeypad(const Action &action) {
    return std::holds_alternative<step::Tap>(action) || std::holds_alternative<step::Keys>(action);
}

bool isScene(const Action &action) {
    const auto *inTest = std::get_if<TestAction>(&action);
    return inTest != nullptr && std::holds_alternative<step::Scene>(*inTest);
}

} // namespace

Journey::Journey(std::istream &input, std::string itsName, Stage stage) : name(std::move(itsName)) {
    int line = 1;
    try {
        for (std::string text; readLine(input, text); line++) {
            if (!isText(text))
                throw std::invalid_argument("this is not text");
            const std::string_view words = trimmed(text);
            if (!words.empty() && words.front() != '#')
                add({line, parseStep(words, stage)});
        }
    } catch (const std::invalid_argument &error) {
        throw std::invalid_argument(place(line) + error.what());
    }
    if (input.bad())
        throw std::invalid_argument(name + ": cannot be read");
    if (allSteps.empty())
        throw std::invalid_argument(name + ": there is no step in it");
}

void Journey::add(Step step) {
    if (allSteps.size() == mostSteps)
        throw std::invalid_argument("there are too many steps");
    // The one poll of a tap could not be told from those of the hold.
    if (isScene(step.action))
        isKeyDown = false;
    if (isKeyDown && isAboutTheKeypad(step.action))
        throw std::invalid_argument("a key is still held: release it first");
    if (std::holds_alternative<step::Hold>(step.action))
        isKeyDown = true;
    if (std::holds_alternative<step::Release>(step.action))
        isKeyDown = false;
    allSteps.push_back(std::move(step));
}

std::string Journey::place(int line) const {
    return name + ":" + std::to_string(line) + ": ";
}

} // namespace emulator
