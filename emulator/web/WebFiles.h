#pragma once

#include <array>
#include <string_view>

namespace emulator {

/// The files of the page, which the build puts into the program.
struct WebFile {
    std::string_view name;
    std::string_view type; ///< as in the header Content-Type
    std::string_view text;
};

extern const std::array<WebFile, 3> webFiles;

} // namespace emulator
