#include "Operator.h"

#include <sys/wait.h>
#include <unistd.h>

namespace {

std::string answerFor(KeyCode key) {
    static const std::map<KeyCode, std::string> answers = {{keyUp, "\x80\xBE"},
                                                           {keyDown, "\x80\xBD"},
                                                           {keyEnter, "\x80\xBB"},
                                                           {keyEscape, "\x80\xB7"}};
    return key == keyNone ? "" : answers.at(key);
}

} // namespace

MainLoop *Operator::running = nullptr;

void standardAppliance(World &appliance) {
    appliance.files["/etc/ma-platform"] = "q75-b\n";
    appliance.portAddresses["eth0"] = "10.1.1.5";
}

void Operator::answer(const std::string &bytes) {
    world().answers = {bytes};
    loop->turn();
}

void Operator::poll(KeyCode key) {
    answer(answerFor(key));
}

void Operator::hold(KeyCode key, int polls) {
    for (int k = 0; k < polls; ++k)
        poll(key);
    answer("?"); // garbled: a release that takes no time
}

void Operator::press(KeyCode key, int times) {
    for (int k = 0; k < times; ++k)
        hold(key, 1);
}

void Operator::keys(const std::string &sequence) {
    static const std::map<char, KeyCode> letters = {
        {'u', keyUp}, {'d', keyDown}, {'e', keyEnter}, {'x', keyEscape}};
    for (std::size_t k = 0; k < sequence.length();) {
        const KeyCode key = letters.at(sequence[k++]);
        int polls = 0;
        while (k < sequence.length() && isdigit(sequence[k]))
            polls = polls * 10 + (sequence[k++] - '0');
        hold(key, polls == 0 ? 1 : polls);
    }
}

void Operator::wait(double seconds) {
    const long long end = world().microseconds + static_cast<long long>(seconds * 1e6);
    while (world().microseconds < end)
        poll();
}

void Operator::waitForPage(const std::string &title) {
    for (int turns = 0; turns < 1000; ++turns) {
        if (sees().compare(0, title.length(), title) == 0)
            return;
        poll();
    }
    FAIL() << "no page " << title << ", the panel shows " << sees();
}

std::string Operator::sees() {
    return world().shown();
}

std::string Operator::cursor() {
    const auto &display = world().display;
    if (!display.cursorBlinking())
        return "off";
    return std::to_string(display.cursorRow()) + "," + std::to_string(display.cursorColumn());
}

void inFreshProgram(const std::function<void()> &check) {
    const pid_t child = fork();
    if (child == 0) {
        check();
        fflush(stdout);
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0) << "see above";
}
