#include "emulator/journey/words.h"

#include <algorithm>
#include <stdexcept>

namespace emulator {

namespace {

// Where the quoted word ends that `text` begins with: behind its second quote.
std::size_t endOfQuoted(std::string_view text) {
    for (std::size_t at = 1; at < text.size(); at++) {
        if (text[at] == '"')
            return at + 1;
        if (text[at] == '\\')
            at++;
    }
    throw std::invalid_argument("a quote is not closed");
}

} // namespace

void skipBlanks(std::string_view &rest) {
    rest.remove_prefix(std::min(rest.find_first_not_of(blanks), rest.size()));
}

std::string_view takeWord(std::string_view &rest) {
    const bool isQuoted = rest.front() == '"';
    const std::size_t end =
        isQuoted ? endOfQuoted(rest) : std::min(rest.find_first_of(blanks), rest.size());
    const std::string_view word = rest.substr(0, end);
    rest.remove_prefix(end);
    if (!rest.empty() && blanks.find(rest.front()) == std::string_view::npos)
        throw std::invalid_argument("there is no blank after a quoted word");
    skipBlanks(rest);
    return word;
}

std::string unquoted(std::string_view word) {
    if (word.front() != '"')
        return std::string(word);
    std::string text;
    for (std::size_t at = 1; at + 1 < word.size(); at++) {
        const bool isEscaped = word[at] == '\\';
        if (isEscaped && std::string_view("\"\\n").find(word[at + 1]) == std::string_view::npos)
            throw std::invalid_argument(
                "in quotes, a backslash can only be followed by \", \\ or n");
        if (isEscaped)
            at++;
        text += isEscaped && word[at] == 'n' ? '\n' : word[at];
    }
    return text;
}

std::string quoted(std::string_view text) {
    std::string word = "\"";
    for (const char c : text) {
        if (c == '"' || c == '\\')
            word += '\\';
        word += c == '\n' ? "\\n" : std::string(1, c);
    }
    return word + "\"";
}

} // namespace emulator
