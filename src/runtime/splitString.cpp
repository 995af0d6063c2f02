#include "runtime/splitString.h"

std::vector<QLX::String<char>> splitString(const QLX::String<char> &text,
                                           const QLX::String<char> &delimiter) {
    if (delimiter.empty() || text.empty())
        return {text};

    std::vector<QLX::String<char>> pieces;
    std::size_t start = 0;
    for (std::size_t end = text.find(delimiter); end != std::string::npos;
         end = text.find(delimiter, start)) {
        pieces.emplace_back(text.substr(start, end - start));
        start = end + delimiter.length();
    }
    if (start < text.length())
        pieces.emplace_back(text.substr(start));
    return pieces;
}
