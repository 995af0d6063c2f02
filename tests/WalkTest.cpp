// Plays the walks: operators' ways through the screens, as data. A walk's sections each start with
// "== TITLE" and meet a program that has just been started. Their lines are
//   interfaces TEXT, hostname TEXT, script TEXT   what a file holds or a command prints; \n is a
//   line feed servers N, port NAME ADDRESS                  DNS servers and ports of the appliance
//   start TITLE                                   the program, on the page whose row 0 begins so
//   KEYS -> ROW 0|ROW 1 [@ ROW,COLUMN]            what is seen after these keys ("." for none); the
//                                                 cursor blinks there, or not at all
//   KEYS sends [HEX...]                           exactly these bytes, key requests left out
//   paused N s ROW 0|ROW 1                        the next pause, while no key is read
//   ran COMMAND behind ROW 0|ROW 1                the next run of the script; SCRIPT is its path
#include "Operator.h"

#include <filesystem>
#include <fstream>
#include <iomanip>
#include <optional>
#include <sstream>

namespace {

const std::filesystem::path walks = WALKS;

std::string replaced(std::string text, const std::string &word, const std::string &by) {
    for (std::size_t at = 0; (at = text.find(word, at)) != std::string::npos; at += by.length())
        text.replace(at, word.length(), by);
    return text;
}

std::string hex(const std::string &bytes) {
    std::ostringstream text;
    for (const char byte : bytes)
        text << " " << std::uppercase << std::hex << std::setfill('0') << std::setw(2)
             << int{static_cast<unsigned char>(byte)};
    return text.str();
}

void expectNext(std::vector<std::string> &seen, const std::string &wanted) {
    ASSERT_FALSE(seen.empty()) << "not " << wanted;
    EXPECT_EQ(seen.front(), wanted);
    seen.erase(seen.begin());
}

class Section {
  public:
    void play(const std::vector<std::string> &lines) {
        standardAppliance(world());
        world().files["/etc/network/interfaces"] = "iface eth0 inet static\naddress 10.1.1.5\n";
        for (const auto &line : lines) {
            SCOPED_TRACE(line);
            playLine(line);
            if (testing::Test::HasFailure())
                return;
        }
        EXPECT_TRUE(world().scripts.empty()) << "also ran " << world().scripts.front();
        EXPECT_TRUE(world().pauses.empty()) << "also paused " << world().pauses.front();
        EXPECT_EQ(world().display.hiddenCharacters() % 24, 0U) << "only a wiped name's blanks";
    }

  private:
    void playLine(const std::string &line) {
        const std::size_t blank = line.find(' ');
        const std::string word = line.substr(0, blank);
        const std::string rest = replaced(line.substr(blank + 1), "\\n", "\n");
        if (word == "interfaces") {
            world().files["/etc/network/interfaces"] = rest;
        } else if (word == "hostname") {
            world().hostname = rest;
        } else if (word == "script") {
            world().scriptOutput = rest;
        } else if (word == "servers") {
            for (int k = 1; k <= std::stoi(rest); ++k)
                world().files["/etc/resolv.conf"] += "nameserver 8.8.8." + std::to_string(k) + "\n";
        } else if (word == "port") {
            world().portAddresses[rest.substr(0, rest.find(' '))] = rest.substr(rest.find(' ') + 1);
        } else if (word == "start") {
            person.emplace().waitForPage(rest);
        } else if (word == "paused") {
            expectNext(world().pauses, rest);
        } else if (word == "ran") {
            expectNext(world().scripts, replaced(rest, "SCRIPT ", applyScript));
        } else {
            press(word, rest);
        }
    }

    void press(const std::string &keys, const std::string &then) {
        world().sent.clear();
        if (keys != ".")
            person->keys(keys);
        if (then.rfind("sends", 0) == 0) {
            const std::string keyRequest("\xFE\0\xFE\x06", 4);
            EXPECT_EQ("sends" + hex(replaced(world().sent, keyRequest, "")), then);
        } else {
            const std::string cursor = Operator::cursor();
            const std::string at = cursor == "off" ? "" : " @ " + cursor;
            EXPECT_EQ("-> " + Operator::sees() + at, then);
        }
    }

    std::optional<Operator> person;
};

class Walk : public testing::TestWithParam<std::string> {};

std::vector<std::string> names() {
    std::vector<std::string> all;
    for (const auto &entry : std::filesystem::directory_iterator(walks))
        all.push_back(entry.path().stem());
    return all;
}

} // namespace

TEST_P(Walk, ShowsAndDoesWhatItSays) {
    std::map<std::string, std::vector<std::string>> sections;
    std::string title, line;
    for (std::ifstream file(walks / (GetParam() + ".walk")); std::getline(file, line);) {
        if (line.empty() || line[0] == '#')
            continue;
        if (line.rfind("== ", 0) == 0) {
            title = line;
        } else {
            sections[title].push_back(line);
        }
    }
    EXPECT_GE(sections.size(), 2U);
    for (const auto &[name, lines] : sections) {
        SCOPED_TRACE(name);
        inFreshProgram([&steps = lines] { Section().play(steps); });
    }
}

INSTANTIATE_TEST_SUITE_P(Screens, Walk, testing::ValuesIn(names()),
                         [](const auto &test) { return test.param; });
