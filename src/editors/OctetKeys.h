// What Up, Down, Enter and Escape do to the octet under the panel's cursor.
#pragma once

#include <cstdint>
#include <string>

/// The value one step up, or three while Up is held long; 255 is followed by 0.
[[nodiscard]] std::int32_t incrementOctet(std::int32_t value);

/// The value one step down, or three while Down is held long; 0 is followed by 255.
[[nodiscard]] std::int32_t decrementOctet(std::int32_t value);

/// Rewrites the three characters of the octet whose last digit the cursor is on, and leaves the
/// cursor there.
void redrawOctet(const std::string &text);

/// Move the cursor to the last digit of the octet on the right or on the left.
void cursorToNextOctet();
void cursorToPrevOctet();
