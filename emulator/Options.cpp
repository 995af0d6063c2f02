#include "emulator/Options.h"

#include "emulator/base/Number.h"
#include "emulator/base/helpEntry.h"
#include "emulator/base/plainAddress.h"
#include "emulator/journey/StepTable.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <getopt.h>
#include <stdexcept>
#include <string_view>
#include <sys/stat.h>
#include <utility>

namespace emulator {

namespace {

// An IPv6 address is written in brackets.
boost::asio::ip::tcp::endpoint parseEndpoint(const std::string &text) {
    constexpr unsigned highestPort = 65'535;
    const std::size_t colon = text.rfind(':');
    const bool hasAddress = colon != std::string::npos;
    std::string address = hasAddress ? text.substr(0, colon) : "127.0.0.1";
    const bool isBracketed = address.size() > 2 && address.front() == '[' && address.back() == ']';
    if (isBracketed)
        address = address.substr(1, address.size() - 2);
    boost::system::error_code error;
    const auto parsed = boost::asio::ip::make_address(address, error);
    if (error || parsed.is_v6() != isBracketed)
        throw std::invalid_argument("'" + text +
                                    "' is not an [ADDRESS:]PORT for --web, such as "
                                    "8080, 127.0.0.1:8080 or [::1]:8080; names are not looked up");
    const boost::asio::ip::address plain = plainAddress(parsed);
    if (plain.is_multicast() || plain == boost::asio::ip::address_v4::broadcast())
        throw std::invalid_argument("no page can be opened at " + address);
    return {parsed,
            static_cast<unsigned short>(parseNumber(hasAddress ? text.substr(colon + 1) : text, 0U,
                                                    highestPort, "a port for --web"))};
}

constexpr const char *versionText = "panel-emulator " KESTROVA_VERSION "\n";

struct OptionKind {
    const char *name;
    const char *value; // what stands for it in the help; null where there is none
    std::string_view help;
    void (*apply)(Options &options, const char *value);
};

constexpr std::array optionKinds{
    OptionKind{"journey", "FILE",
               "play the steps of FILE, or of standard input if FILE is -,\n"
               "instead of showing the panel on the terminal",
               [](Options &options, const char *value) { options.journey = value; }},
    OptionKind{"show", nullptr, "also draw the panel on the terminal while a journey is played",
               [](Options &options, const char *) { options.show = true; }},
    OptionKind{"record", "FILE",
               "write what is done at the panel, and what it showed, to FILE\n"
               "as a journey that can be played again",
               [](Options &options, const char *value) { options.record = value; }},
    OptionKind{"pictures", "DIR", "also write each picture of the journey to DIR/NAME.svg",
               [](Options &options, const char *value) { options.pictures = value; }},
    OptionKind{"limit", "SECONDS",
               "let a step of the journey wait so long for the panel\n"
               "(default: 10)",
               [](Options &options, const char *value) {
                   options.limit = seconds(parseNumber(value, shortestLimit, longestLimit,
                                                       "a number of seconds for --limit"));
               }},
    OptionKind{"fast", nullptr, "show bytes as soon as they arrive instead of at 2400 baud",
               [](Options &options, const char *) { options.fast = true; }},
    OptionKind{"trace", "FILE",
               "write a line to FILE whenever bytes arrive (<) and whenever\n"
               "a key request is answered (>): the time in nanoseconds, the\n"
               "direction, and the bytes in hexadecimal",
               [](Options &options, const char *value) { options.trace = value; }},
    OptionKind{"web", "[ADDRESS:]PORT",
               "serve the panel as a page for browsers instead of showing it\n"
               "on the terminal, and print the page's address. Without an\n"
               "ADDRESS it can be opened on this machine only; PORT 0 stands\n"
               "for any free port",
               [](Options &options, const char *value) { options.web = parseEndpoint(value); }},
    OptionKind{"version", nullptr, "show the version",
               [](Options &options, const char *) { options.answer = versionText; }},
    OptionKind{"help", nullptr, "show this text",
               [](Options &options, const char *) { options.answer = Options::helpText(); }},
};

// Where a file will be that is not there yet: behind its links.
std::filesystem::path nameOfNewFile(std::filesystem::path path) {
    constexpr int mostLinks = 40;
    for (int links = 0; links < mostLinks && is_symlink(path); links++)
        path = path.parent_path() / read_symlink(path);
    return weakly_canonical(absolute(path));
}

// Of a file that is not there yet, the name counts.
bool isSameFile(const std::string &one, const std::string &other) {
    struct stat first{}, second{};
    const bool isThere = stat(one.c_str(), &first) == 0;
    if (isThere != (stat(other.c_str(), &second) == 0))
        return false;
    if (!isThere)
        return nameOfNewFile(one) == nameOfNewFile(other);
    return S_ISREG(first.st_mode) && first.st_dev == second.st_dev && first.st_ino == second.st_ino;
}

std::string optionsHelp() {
    constexpr std::size_t indent = 21;
    std::string text;
    for (const OptionKind &kind : optionKinds) {
        std::string line = kind.name == std::string_view("help") ? "  -h, --" : "  --";
        line += kind.name;
        if (kind.value != nullptr)
            line += std::string(" ") + kind.value;
        text += helpEntry(line, kind.help, indent);
    }
    return text;
}

} // namespace

Options Options::parse(int argc, char *const *argv) {
    std::array<option, optionKinds.size() + 1> names{};
    for (std::size_t k = 0; k < optionKinds.size(); k++) {
        const OptionKind &kind = optionKinds.at(k);
        names.at(k) = {kind.name, kind.value == nullptr ? no_argument : required_argument, nullptr,
                       static_cast<int>(k)};
    }
    Options options;
    optind = 1; // getopt keeps its place from the last time
    opterr = 0;
    for (;;) {
        const std::string argument = optind < argc ? argv[optind] : "";
        const int found = getopt_long(argc, argv, "+:h", names.data(), nullptr);
        if (found == ':')
            throw std::invalid_argument(argument + " needs a value");
        if (found == '?')
            throw std::invalid_argument("unknown option " + argument);
        if (found == -1)
            break;
        if (optarg != nullptr && *optarg == '\0')
            throw std::invalid_argument(argument + " needs a value that is not empty");
        if (found == 'h')
            options.answer = helpText();
        else
            optionKinds.at(static_cast<std::size_t>(found)).apply(options, optarg);
        if (!options.answer.empty())
            return options;
    }
    options.command.assign(argv + optind, argv + argc);
    if (options.command.empty())
        throw std::invalid_argument("there is no command to start");
    if (options.show && !options.journey)
        throw std::invalid_argument("--show needs a --journey");
    if (options.show && options.web)
        throw std::invalid_argument("--show and --web cannot be combined");
    return options;
}

void Options::checkFiles() const {
    constexpr const char *standardInput = "/dev/stdin";
    const std::array<std::pair<const char *, std::optional<std::string>>, 3> files{{
        {"--journey", journey == "-" ? standardInput : journey},
        {"--record", record},
        {"--trace", trace},
    }};
    for (const auto &[name, file] : files) {
        for (const auto &[otherName, otherFile] : files) {
            if (name != otherName && file && otherFile && isSameFile(*file, *otherFile))
                throw std::invalid_argument(std::string(name) + " and " + otherName +
                                            " name the same file");
        }
    }
}

std::string Options::helpText() {
    return R"(Usage: panel-emulator [OPTION...] -- COMMAND [ARGUMENT...]

Starts COMMAND with an emulated front panel (two rows of 16 characters, four keys)
at the far end of a pseudo-terminal, and ends it when the emulator ends. In the
ARGUMENTs, {tty} is replaced by the path of the pseudo-terminal, which the
environment variable PANEL_TTY contains, too. The line is raw and runs at 2400 baud
in both directions. COMMAND has no terminal of its own, and its standard input is
empty.

)" + optionsHelp() +
           R"(
On the terminal:
  arrow up, arrow down, Enter, Escape    tap the panel's key of that name
  the same with Shift, or u, d, e, x     hold the key until it, or any other key,
                                         is pressed again
  mouse on a drawn key                   hold the key as long as the button is held
  q                                      quit
A key that is typed while the program does not ask for one is forgotten, as on a
real panel. What COMMAND prints is not shown while it runs; the last lines are
shown if COMMAND ends by itself.

On the page, a key is down for as long as it is held. The address of the page contains
a token that is made at each start; whoever has it can use the panel.

A journey has one step on each line; # begins a comment. KEY is up, down, enter or
escape. A word that contains blanks is written in double quotes; in the quotes, \",
\\ and \n stand for ", \ and a line feed. SIGHT is what the panel has to show:
  "ROW 0" ["ROW 1"] [at ROW COLUMN]
                     these rows, each filled up with blanks, where * stands for any
                     row 0; the second row may be anything if ROW 1 is not given. With
                     at, the cursor blinks there
  chosen "TEXT"      the marker > in front of this entry of a list, in either row
The steps are:
)" + stepsHelp(Stage::panel) +
           R"(The commands that a journey runs find PANEL_TTY and PANEL_COMMAND_PID, the number of
the process that panel-emulator has started, in their environment.

These steps can be used only in the program's tests, in virtual time:
)" + stepsHelp(Stage::test) +
           R"(
The exit status is 0 if the journey was played to its end or q was pressed, 1 if a
step failed, COMMAND ended before the journey did or not everything could be
written, 2 if the arguments were wrong, and 128 + N if signal N ended the emulator.
Without a journey, if COMMAND ends by itself, it is the status of COMMAND.
)";
}

} // namespace emulator
