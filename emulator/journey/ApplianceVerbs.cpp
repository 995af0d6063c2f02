#include "emulator/journey/ApplianceVerbs.h"

#include "emulator/base/Number.h"
#include "emulator/base/helpEntry.h"

#include <algorithm>
#include <arpa/inet.h>
#include <array>
#include <sstream>
#include <stdexcept>
#include <string_view>

namespace emulator {

namespace {

constexpr int longestHang = 3600; // seconds
constexpr int longestPrefix = 32;

// In a usage, words in small letters stand for themselves, words in capital letters for a value,
// and | separates choices.
struct Verb {
    std::string_view usage;
    std::string_view help;
};

constexpr std::array verbs{
    Verb{"script works|fails|chatters", "let the configuration script do this from here on"},
    Verb{"script hangs SECONDS", "let it wait so long before it does its work"},
    Verb{"port NAME ADDRESS/PREFIX|-|gone", "set the port's address, or none, or take it away"},
    Verb{"hostname NAME", "set the host name, also for after a reboot"},
    Verb{"file PATH TEXT", "write a file that consists of this text"},
    Verb{"remove PATH", "remove a file"},
    Verb{"refresh", "have the program list its ports again"},
    Verb{"reboot", "end the program and start it again"},
    Verb{"has port NAME ADDRESS/PREFIX|-", "check that the port has this address, or none"},
    Verb{"has gateway ADDRESS PORT", "check the default route"},
    Verb{"has hostname NAME", "check the host name, now and after a reboot"},
    Verb{"has file PATH TEXT", "check that the file contains these lines together"},
};

std::vector<std::string> split(std::string_view text, char separator) {
    std::vector<std::string> pieces;
    std::istringstream input{std::string(text)};
    for (std::string piece; std::getline(input, piece, separator);)
        pieces.push_back(piece);
    return pieces;
}

bool isAddress(const std::string &text) {
    in_addr ignored{};
    return inet_pton(AF_INET, text.c_str(), &ignored) == 1;
}

bool isNumber(const std::string &text, int most) try {
    parseNumber(text, 0, most, "");
    return true;
} catch (const std::invalid_argument &) {
    return false;
}

bool isName(const std::string &text) {
    constexpr std::string_view letters =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-_.";
    return !text.empty() && text.front() != '-' &&
           text.find_first_not_of(letters) == std::string::npos;
}

bool isValue(const std::string &text, const std::string &kind) {
    if (kind == "TEXT")
        return true;
    if (kind == "SECONDS")
        return isNumber(text, longestHang);
    if (kind == "PATH")
        return !text.empty() && text.front() == '/';
    if (kind == "ADDRESS")
        return isAddress(text);
    if (kind == "ADDRESS/PREFIX")
        return isAddress(text.substr(0, text.find('/'))) && text.find('/') != std::string::npos &&
               isNumber(text.substr(text.find('/') + 1), longestPrefix);
    return isName(text);
}

bool isChoice(const std::string &word, const std::string &choices) {
    const std::vector<std::string> all = split(choices, '|');
    return std::any_of(all.begin(), all.end(), [&](const std::string &choice) {
        const bool standsForAValue = choice.front() >= 'A' && choice.front() <= 'Z';
        return standsForAValue ? isValue(word, choice) : word == choice;
    });
}

} // namespace

void checkVerb(const std::vector<std::string> &words) {
    const auto usagesOf = [](const std::vector<std::string> &beginning) {
        std::string usages;
        for (const Verb &verb : verbs) {
            const std::vector<std::string> wanted = split(verb.usage, ' ');
            if (wanted.size() >= beginning.size() &&
                std::equal(beginning.begin(), beginning.end(), wanted.begin()))
                usages += (usages.empty() ? "" : " or ") + std::string("appliance ") +
                          std::string(verb.usage);
        }
        return usages;
    };
    for (const Verb &verb : verbs) {
        const std::vector<std::string> wanted = split(verb.usage, ' ');
        if (wanted.size() == words.size() &&
            std::equal(words.begin(), words.end(), wanted.begin(), isChoice))
            return;
    }
    const std::string usages = usagesOf({words.front()});
    if (usages.empty())
        throw std::invalid_argument("'" + words.front() + "' is not a verb of the appliance");
    if (words.front() != "has" || words.size() == 1)
        throw std::invalid_argument("usage: " + usages);
    const std::string closer = usagesOf({words[0], words[1]});
    throw std::invalid_argument(closer.empty()
                                    ? "'" + words[1] + "' cannot be checked; usage: " + usages
                                    : "usage: " + closer);
}

std::string verbsHelp() {
    constexpr std::size_t indent = 35;
    std::string text;
    for (const Verb &verb : verbs)
        text += helpEntry("  " + std::string(verb.usage), verb.help, indent);
    return text;
}

} // namespace emulator
