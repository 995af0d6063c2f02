#include "emulator/journey/expandTable.h"

#include <algorithm>

namespace emulator {

namespace {

using Words = std::vector<std::string>;

bool isRow(const TextLine &line) {
    return line.text.compare(0, 5, "with ") == 0;
}

// Quoted words keep their quotes, and may contain blanks and escaped quotes. A comment ends the
// words.
Words wordsOf(const TextLine &row) {
    Words words{""};
    bool isQuoted = false;
    for (std::size_t at = 0; at < row.text.size(); at++) {
        const char c = row.text[at];
        if (!isQuoted && c == '#' && words.back().empty())
            break;
        if (!isQuoted && (c == ' ' || c == '\t')) {
            if (!words.back().empty())
                words.emplace_back();
            continue;
        }
        isQuoted = isQuoted != (c == '"');
        words.back() += c;
        if (isQuoted && c == '\\' && at + 1 < row.text.size())
            words.back() += row.text[++at];
    }
    if (words.back().empty())
        words.pop_back();
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
