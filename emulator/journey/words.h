// The words of a journey's lines: separated by blanks, and in quotes if they contain any.
#pragma once

#include <string>
#include <string_view>

namespace emulator {

/// The carriage return is one because some editors end lines with it.
constexpr std::string_view blanks = " \t\r";

/// True when nothing follows, or only a comment.
inline bool isEndOfWords(std::string_view rest) {
    return rest.empty() || rest.front() == '#';
}

/// Takes the blanks off the front.
void skipBlanks(std::string_view &rest);

/// Takes the first word off the front, as it is written there, and the blanks behind it. Throws
/// std::invalid_argument if its quote is not closed, or ends before the word does.
std::string_view takeWord(std::string_view &rest);

/// What a word stands for: without its quotes, and with \", \\ and \n replaced. Throws
/// std::invalid_argument at another backslash in quotes.
std::string unquoted(std::string_view word);

/// The word as it has to stand in a journey to be read as `text`: in quotes, with \", \\ and \n.
std::string quoted(std::string_view text);

} // namespace emulator
