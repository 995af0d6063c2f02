// Conversions between the text of an IPv4 address and its four octets.
#pragma once

#include <array>
#include <cstdint>
#include <string>

/// Four octets, the most significant first. Not limited to 0..255 until they are formatted.
using Octets = std::array<std::int32_t, 4>;

/// Reads an address leniently, as the system's files may hold anything: what is not a number counts
/// as 0, and the last part stands for every octet that is missing ("10.1" is 10.1.1.1). The text is
/// consumed.
void parseDottedQuad(std::string &text, Octets &octets);

/// Each octet limited to 0..255; with `padded`, three columns wide as the panel shows it.
[[nodiscard]] std::string formatDottedQuad(const Octets &octets, bool padded);

/// One octet in the same form.
[[nodiscard]] std::string formatOctet(std::int32_t value, bool padded);
