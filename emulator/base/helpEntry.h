// One entry of a help text: how it is used, and beside or below it what it does.
#pragma once

#include <string>
#include <string_view>

namespace emulator {

/// Puts `help`, whose lines are separated by line feeds, into column `indent`. It begins beside
/// `usage` if there is room for two blanks between them, and below it if there is not.
inline std::string helpEntry(std::string usage, std::string_view help, std::size_t indent) {
    const std::string newLine = "\n" + std::string(indent, ' ');
    if (usage.size() + 2 <= indent)
        usage.resize(indent, ' ');
    else
        usage += newLine;
    for (const char c : help)
        usage += c == '\n' ? newLine : std::string(1, c);
    return usage + "\n";
}

} // namespace emulator
