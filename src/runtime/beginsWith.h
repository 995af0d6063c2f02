#pragma once

#include <string>
#include <string_view>

/// True when the first characters of `text` are exactly `prefix`.
[[nodiscard]] inline bool beginsWith(const std::string &text, std::string_view prefix) {
    return text.compare(0, prefix.length(), prefix) == 0;
}
