#pragma once

#include "emulator/base/Clock.h"

#include <boost/asio/ip/tcp.hpp>

#include <optional>
#include <string>
#include <vector>

namespace emulator {

/// What panel-emulator was asked to do.
struct Options {
    std::string answer; ///< what is printed and nothing else done; empty if a command is started
    bool fast = false;
    bool show = false;
    std::optional<std::string> journey; ///< file, or "-" for standard input
    std::optional<std::string> pictures;
    std::optional<std::string> record;
    std::optional<std::string> trace;
    std::optional<boost::asio::ip::tcp::endpoint> web; ///< where the page is served
    Clock::duration limit = std::chrono::seconds(10);
    std::vector<std::string> command;

    /// True when the panel is drawn on the terminal.
    [[nodiscard]] bool isDrawn() const { return show || (!journey && !web); }

    /// Reads the program's arguments. Throws std::invalid_argument with one line when they are
    /// wrong.
    static Options parse(int argc, char *const *argv);

    /// Throws std::invalid_argument if two of the files are one, of which the other's contents
    /// would be lost.
    void checkFiles() const;

    /// The text of `--help`.
    static std::string helpText();
};

} // namespace emulator
