#include "emulator/journey/expandTable.h"

#include "emulator/journey/words.h"

#include <algorithm>
#include <stdexcept>

namespace emulator {

namespace {

using Words = std::vector<std::string_view>;

bool isRow(const TextLine &line) {
    return firstWord(line) == "with";
}

// The first is "with". Quoted words keep their quotes.
Words wordsOf(const TextLine &row) {
    Words words;
    for (std::string_view rest = row.text; !isEndOfWords(rest);)
        words.push_back(takeWord(rest));
    return words;
}

// Of $1 to $9 in the text, those are replaced that the row has a word for.
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

std::string_view firstWord(const TextLine &line) {
    return std::string_view(line.text).substr(0, line.text.find_first_of(blanks));
}

std::vector<TextLine> expandTable(const std::vector<TextLine> &scene,
                                  const std::function<std::string(int)> &place) {
    if (std::none_of(scene.begin(), scene.end(), isRow))
        return scene;
    std::vector<TextLine> lines;
    std::size_t columns = 0;
    for (const TextLine &row : scene) {
        if (!isRow(row))
            continue;
        try {
            const Words words = wordsOf(row);
            if (words.size() < 2)
                throw std::invalid_argument("usage: with WORD...");
            if (columns != 0 && words.size() != columns)
                throw std::invalid_argument("the row has not as many words as the first");
            columns = words.size();
            for (const TextLine &line : scene) {
                if (!isRow(line))
                    lines.push_back({line.number, filledIn(line.text, words)});
            }
        } catch (const std::invalid_argument &error) {
            throw std::invalid_argument(place(row.number) + error.what());
        }
    }
    return lines;
}

} // namespace emulator
