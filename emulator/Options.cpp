#include "Options.h"

#include <getopt.h>

#include <charconv>
#include <stdexcept>
#include <string_view>

namespace emulator {

namespace {

constexpr double longestLimit = 86'400;

Clock::duration parseLimit(const std::string &text) {
    double count = 0;
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, count);
    if (error != std::errc() || stop != end || !(count > 0 && count <= longestLimit))
        throw std::invalid_argument("--limit wants a number of seconds, not '" + text + "'");
    return seconds(count);
}

} // namespace

Options Options::parse(int argc, char *const *argv) {
    const option names[] = {
        {"help", no_argument, nullptr, 'h'},
        {"fast", no_argument, nullptr, 'f'},
        {"journey", required_argument, nullptr, 'j'},
        {"pictures", required_argument, nullptr, 'p'},
        {"trace", required_argument, nullptr, 't'},
        {"limit", required_argument, nullptr, 'l'},
        {nullptr, 0, nullptr, 0},
    };
    Options options;
    optind = 0; // start over, whoever parsed before
    for (;;) {
        switch (getopt_long(argc, argv, "+:h", static_cast<const option *>(names), nullptr)) {
        case 'h':
            options.help = true;
            return options;
        case 'f':
            options.fast = true;
            break;
        case 'j':
            options.journey = optarg;
            break;
        case 'p':
            options.pictures = optarg;
            break;
        case 't':
            options.trace = optarg;
            break;
        case 'l':
            options.limit = parseLimit(optarg);
            break;
        case ':':
            throw std::invalid_argument(std::string(argv[optind - 1]) + " wants a value");
        case '?':
            throw std::invalid_argument("unknown option " + std::string(argv[optind - 1]));
        default:
            options.command.assign(argv + optind, argv + argc);
            if (options.command.empty())
                throw std::invalid_argument("no command to start");
            return options;
        }
    }
}

const char *Options::helpText() {
    return R"(Usage: panel-emulator [OPTION...] -- COMMAND [ARGUMENT...]

Starts COMMAND with an emulated front panel (two rows of 16 characters, four keys)
on a pseudo-terminal, and ends it when the emulator ends. In the ARGUMENTs, {tty}
stands for the path of the pseudo-terminal that COMMAND is to open; the
environment variable PANEL_TTY holds it too. The line is raw, at 2400 baud both
ways. COMMAND's standard input is empty.

  --journey FILE     play the steps of FILE (- is standard input) instead of
                     showing the panel on the terminal
  --pictures DIR     also write each picture of the journey to DIR/NAME.svg
  --limit SECONDS    how long a step of the journey waits for the panel (default 10)
  --fast             show bytes as they come instead of at 2400 baud
  --trace FILE       write a line for each arrival (<) and answer (>) to FILE:
                     monotonic nanoseconds, direction, bytes in hex
  -h, --help         show this text

On the terminal:
  arrow up, arrow down, Enter, Escape    tap the panel's key of that name
  the same with Shift, or u, d, e, x     hold the key until it is pressed again,
                                         or any other key is
  mouse on a drawn key                   down is down, up is up
  q                                      quit
COMMAND's output is kept back; the last of it is shown if COMMAND ends by itself.

A journey has one step a line; # begins a comment. KEY is up, down, enter or
escape. A word with blanks stands in quotes, with \" and \\ for " and \.
  tap KEY [N]        press the key for exactly one poll, N times; each ends when a
                     whole poll has gone by without it
  hold KEY POLLS     press the key and wait until it has answered that many key
                     requests; it stays down, so another hold counts on
  release            let go, and wait until a whole poll has gone by
  wait SECONDS       let time pass
  expect "ROW 0" "ROW 1"
                     wait until the visible text is this, filled up with blanks
  expect-cursor ROW COLUMN on|off
                     wait until the cursor is there, blinking or not
  picture NAME       print the panel, with v or ^ at a blinking cursor
  say TEXT           print the rest of the line
  limit SECONDS      how long the steps from here on wait for the panel
  run COMMAND        have /bin/sh run the rest of the line, for 60 s at most; it
                     must end with status 0. PANEL_TTY and PANEL_COMMAND_PID (the
                     process that panel-emulator started) are in its environment

Exit status: 0 when the journey was played to its end; 1 when a step failed or
COMMAND ended too early; 2 for wrong usage; 128 + N after signal N. On the terminal:
that of COMMAND if it ended by itself, 0 after q.
)";
}

} // namespace emulator
