#include "emulator/journey/expandTable.h"

#include <algorithm>
#include <regex>

namespace emulator {

namespace {

using Words = std::vector<std::string>;

bool isRow(const TextLine &line) {
    return line.text.compare(0, 5, "with ") == 0;
}

// A quoted word may contain blanks and escaped quotes; a comment ends the words.
Words wordsOf(const TextLine &row) {
    static const std::regex word(R"(#.*|"(\\.|[^"\\])*"|\S+)");
    Words words;
    for (std::sregex_iterator each(row.text.begin(), row.text.end(), word), end; each != end;
         ++each)
        words.push_back(each->str());
    words.erase(std::find_if(words.begin(), words.end(),
                             [](const std::string &text) { return text.front() == '#'; }),
                words.end());
    return words; // the first is "with"
}

std::string filledIn(const std::string &text, const Words &row) {
    std::string filled;
    for (std::size_t at = 0; at < text.size(); at++) {
        const bool isPlace =
            text[at] == '$' && at + 1 < text.size() && text[at + 1] >= '1' && text[at + 1] <= '9';
        const auto number = isPlace ? static_cast<std::size_t>(text[at + 1] - '0') : row.size();
        if (number < row.size()) {
            filled += row[number];
            at++;
        } else {
            filled += text[at];
        }
    }
    return filled;
}

} // namespace

std::vector<TextLine> expandTable(const std::vector<TextLine> &scene) {
    if (std::none_of(scene.begin(), scene.end(), isRow))
        return scene;
    std::vector<TextLine> lines;
    for (const TextLine &row : scene) {
        if (!isRow(row))
            continue;
        const Words words = wordsOf(row);
        for (const TextLine &line : scene) {
            if (!isRow(line))
                lines.push_back({line.number, filledIn(line.text, words)});
        }
    }
    return lines;
}

} // namespace emulator
