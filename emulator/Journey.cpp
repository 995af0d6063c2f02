#include "Journey.h"

#include <algorithm>
#include <charconv>
#include <stdexcept>
#include <string_view>

namespace emulator {

namespace {

using Step = Journey::Step;
using Words = std::vector<std::string>;

constexpr int mostPolls = 100'000;
constexpr double mostSeconds = 86'400;
constexpr std::string_view blanks = " \t\r";

[[noreturn]] void reject(const std::string &reason) {
    throw std::invalid_argument(reason);
}

template <typename Number>
Number parseNumber(const std::string &word, Number least, Number most, const std::string &what) {
    Number value{};
    const char *end = word.data() + word.size();
    const auto [stop, error] = std::from_chars(word.data(), end, value);
    // Written so that a "nan" is out of range.
    if (error != std::errc() || stop != end || !(value >= least && value <= most))
        reject("'" + word + "' is not " + what);
    return value;
}

Clock::duration parseSeconds(const std::string &word) {
    return seconds(parseNumber(word, 0.0, mostSeconds, "a number of seconds"));
}

Key parseKey(const std::string &word) {
    const auto *found = std::find_if(keys.begin(), keys.end(),
                                     [&](const KeyTraits &key) { return key.name == word; });
    if (found == keys.end())
        reject("'" + word + "' is not a key: up, down, enter or escape");
    return found->key;
}

std::string parseName(const std::string &word) {
    const bool plain = word.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                              "0123456789-_.") == std::string::npos;
    if (!plain || word.empty() || word.front() == '.')
        reject("'" + word + "' is no name for a picture: letters, digits, - _ and .");
    return word;
}

Words splitWords(std::string_view line) {
    Words words;
    std::size_t at = 0;
    while ((at = line.find_first_not_of(blanks, at)) != std::string_view::npos && line[at] != '#') {
        std::string word;
        if (line[at] != '"') {
            const std::size_t end = std::min(line.find_first_of(blanks, at), line.size());
            word = line.substr(at, end - at);
            at = end;
        } else {
            for (at++; at < line.size() && line[at] != '"'; at++) {
                if (line[at] == '\\')
                    at++;
                if (at < line.size())
                    word += line[at];
            }
            if (at >= line.size())
                reject("a quote is not closed");
            at++;
        }
        words.push_back(std::move(word));
    }
    return words;
}

Step parseTap(const Words &words) {
    Step step;
    step.key = parseKey(words.at(1));
    if (words.size() > 2)
        step.count = parseNumber(words[2], 1, mostPolls, "a number of taps");
    return step;
}

Step parseHold(const Words &words) {
    Step step;
    step.key = parseKey(words.at(1));
    step.count = parseNumber(words.at(2), 1, mostPolls, "a number of polls");
    return step;
}

Step parseNothing(const Words &) {
    return {};
}

Step parseTime(const Words &words) {
    Step step;
    step.time = parseSeconds(words.at(1));
    return step;
}

Step parseExpect(const Words &words) {
    Step step;
    for (std::size_t row = 0; row < step.rows.size(); row++) {
        const std::string &text = words.at(row + 1);
        if (text.size() > Display::visibleColumns)
            reject("\"" + text + "\" is wider than a row");
        step.rows.at(row) = text;
        step.rows.at(row).resize(Display::visibleColumns, ' ');
    }
    return step;
}

Step parseExpectCursor(const Words &words) {
    Step step;
    step.row = parseNumber(words.at(1), 0, Display::rowCount - 1, "a row");
    step.column = parseNumber(words.at(2), 0, Display::columns - 1, "a column");
    if (words.at(3) != "on" && words.at(3) != "off")
        reject("'" + words.at(3) + "' is not on or off");
    step.blinking = words.at(3) == "on";
    return step;
}

Step parsePicture(const Words &words) {
    Step step;
    step.text = parseName(words.at(1));
    return step;
}

struct Syntax {
    std::string_view name;
    Journey::Action action;
    std::size_t fewestWords, mostWords;
    Step (*parse)(const Words &);
    std::string_view usage;
};

// `say` and `run` take the rest of their line as it is and so have no words to parse.
constexpr std::array<Syntax, 10> syntaxes{{
    {"tap", Journey::Action::tap, 1, 2, parseTap, "tap KEY [N]"},
    {"hold", Journey::Action::hold, 2, 2, parseHold, "hold KEY POLLS"},
    {"release", Journey::Action::release, 0, 0, parseNothing, "release"},
    {"wait", Journey::Action::wait, 1, 1, parseTime, "wait SECONDS"},
    {"expect", Journey::Action::expect, 2, 2, parseExpect, "expect \"row 0\" \"row 1\""},
    {"expect-cursor", Journey::Action::expectCursor, 3, 3, parseExpectCursor,
     "expect-cursor ROW COLUMN on|off"},
    {"picture", Journey::Action::picture, 1, 1, parsePicture, "picture NAME"},
    {"say", Journey::Action::say, 0, 0, nullptr, "say TEXT"},
    {"limit", Journey::Action::limit, 1, 1, parseTime, "limit SECONDS"},
    {"run", Journey::Action::run, 0, 0, nullptr, "run COMMAND"},
}};

Step parseStep(const std::string &name, std::string_view line) {
    const auto *syntax = std::find_if(syntaxes.begin(), syntaxes.end(),
                                      [&](const Syntax &s) { return s.name == name; });
    if (syntax == syntaxes.end())
        reject("'" + name + "' is not a step");
    Step step;
    if (syntax->parse != nullptr) {
        const Words words = splitWords(line);
        const std::size_t arguments = words.size() - 1;
        if (arguments < syntax->fewestWords || arguments > syntax->mostWords)
            reject("usage: " + std::string(syntax->usage));
        step = syntax->parse(words);
    } else {
        const std::size_t start = line.find_first_not_of(blanks, name.size());
        if (start != std::string_view::npos)
            step.text = line.substr(start);
        if (step.text.empty() && syntax->action == Journey::Action::run)
            reject("usage: " + std::string(syntax->usage));
    }
    step.action = syntax->action;
    return step;
}

} // namespace

Journey::Journey(std::istream &input, std::string name) : name_(std::move(name)) {
    bool held = false;
    std::string text;
    for (int line = 1; std::getline(input, text); line++) {
        std::string_view rest = text;
        rest.remove_prefix(std::min(rest.find_first_not_of(blanks), rest.size()));
        rest.remove_suffix(rest.size() - (rest.find_last_not_of(blanks) + 1));
        if (rest.empty() || rest.front() == '#')
            continue;
        try {
            const std::string word(rest.substr(0, rest.find_first_of(blanks)));
            Step step = parseStep(word, rest);
            step.line = line;
            // A tap's one poll could not be told from the hold's.
            if (step.action == Action::tap && held)
                reject("a key is still held: release it first");
            if (step.action == Action::hold)
                held = true;
            if (step.action == Action::release)
                held = false;
            steps_.push_back(std::move(step));
        } catch (const std::invalid_argument &error) {
            throw std::invalid_argument(place(line) + error.what());
        }
    }
    if (input.bad())
        throw std::invalid_argument(name_ + ": cannot be read");
}

std::string Journey::place(int line) const {
    return name_ + ":" + std::to_string(line) + ": ";
}

} // namespace emulator
