#pragma once

#include "runtime/String.h"

#include <vector>

/// The pieces of `text` between the occurrences of `delimiter`, in order. Empty pieces at the start
/// and between two delimiters are kept; a delimiter at the very end yields no empty last piece.
/// With an empty text or an empty delimiter the only piece is the text itself.
[[nodiscard]] std::vector<QLX::String<char>> splitString(const QLX::String<char> &text,
                                                         const QLX::String<char> &delimiter);
