#pragma once

#include <array>
#include <string_view>

namespace emulator {

enum class Key { up, down, enter, escape };

struct KeyTraits {
    Key key;
    std::string_view name; ///< as written in a journey
    char letter;           ///< in the short form, and on a terminal that cannot tell Shift
    unsigned char code;    ///< second byte of the panel's answer: one bit low for each key
};

inline constexpr std::array<KeyTraits, 4> keys{{
    {Key::up, "up", 'u', 0xBE},
    {Key::down, "down", 'd', 0xBD},
    {Key::enter, "enter", 'e', 0xBB},
    {Key::escape, "escape", 'x', 0xB7},
}};

constexpr const KeyTraits &traits(Key key) {
    return keys[static_cast<std::size_t>(key)];
}

} // namespace emulator
