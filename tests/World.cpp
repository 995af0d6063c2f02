#include "World.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <dlfcn.h>
#include <fcntl.h>
#include <poll.h>
#include <set>
#include <sys/mman.h>
#include <sys/time.h>
#include <unistd.h>

World &world() {
    static auto *const theWorld = new World;
    return *theWorld;
}

namespace {

constexpr int panelDescriptor = 4242;
constexpr long long pollTimeout = 500'000, answerTime = 25'000, turnPause = 100'000; // microseconds

bool startsWith(const std::string &text, const std::string &beginning) {
    return text.compare(0, beginning.length(), beginning) == 0;
}

// What stands between `before` and `after` in a command line made of just these three.
bool between(const std::string &command, const std::string &before, const std::string &after,
             std::string &name) {
    if (!startsWith(command, before) || command.length() < before.length() + after.length())
        return false;
    name = command.substr(before.length(), command.length() - before.length() - after.length());
    return before + name + after == command;
}

void once(std::function<void()> &event) {
    if (event)
        std::exchange(event, nullptr)();
}

FILE *openContents(const std::string &contents) {
    const int descriptor = memfd_create("contents", 0);
    if (write(descriptor, contents.data(), contents.length()) < 0)
        abort();
    lseek(descriptor, 0, SEEK_SET);
    return fdopen(descriptor, "r");
}

} // namespace

std::string World::shown() const {
    const auto withoutBlanksAtEnd = [](std::string row) {
        row.erase(row.find_last_not_of(' ') + 1);
        return row;
    };
    return withoutBlanksAtEnd(display.visibleRow(0)) + "|" +
           withoutBlanksAtEnd(display.visibleRow(1));
}

std::string World::run(const std::string &command) {
    static const std::string listing =
        "echo \"`ifconfig -s |       sed 1d |       egrep -v 'lo|ani|docker|v|ipsec_|ssl_' |"
        "       awk '{ print $1 } '`\\neth4\\neth5\" |       sort -u | tr '\n' ','";
    if (const auto fixed = outputs.find(command); fixed != outputs.end())
        return fixed->second;
    std::string name;
    if (command == listing) {
        std::set<std::string> names = {"eth4", "eth5"};
        for (const auto &port : portAddresses)
            names.insert(port.first);
        std::string joined;
        for (const auto &each : names)
            joined += each + ",";
        return joined;
    }
    if (between(command, "ifconfig ", " | grep 'inet' | awk '{ print $2 }' | head -n1", name)) {
        const std::string address = portAddresses.count(name) ? portAddresses[name] : "";
        return address.empty() ? "" : address + "\n";
    }
    if (between(command, "ifconfig | grep '", "'", name)) {
        return portAddresses.count(name) ? name + ": flags=4163<UP>  mtu 1500\n" : "";
    }
    if (between(command,
                "cat /etc/network/interfaces 2>/dev/null |         grep -v \"#\" | grep \"iface ",
                " \" |         awk '{ print $4 }'", name)) {
        return portMethods.count(name) ? portMethods[name] + "\n" : "";
    }
    if (command == "hostname")
        return hostname;
    if (startsWith(command, applyScript))
        return scriptOutput;
    ADD_FAILURE() << "a command that no appliance knows: " << command;
    return "";
}

std::vector<std::string> World::commands(const std::string &beginning) const {
    std::vector<std::string> found;
    for (const auto &event : events) {
        if (startsWith(event, beginning))
            found.push_back(event.substr(event.find(' ') + 1));
    }
    return found;
}

// The calls of the program, and of nobody else, are led here by the linker, which gives the names.
// NOLINTBEGIN(bugprone-reserved-identifier,readability-inconsistent-declaration-parameter-name)
extern "C" {

int __real_open(const char *path, int flags, mode_t mode);
ssize_t __real_read(int descriptor, void *buffer, size_t size);
ssize_t __real_write(int descriptor, const void *bytes, size_t size);
int __real_poll(pollfd *descriptors, nfds_t count, int timeout);

int __wrap_open(const char *path, int flags, ...) {
    if (std::string(path) == "/dev/ttyS1") {
        EXPECT_EQ(flags, O_RDWR | O_NONBLOCK);
        return panelDescriptor;
    }
    va_list rest;
    va_start(rest, flags);
    const auto mode = va_arg(rest, mode_t);
    va_end(rest);
    return __real_open(path, flags, mode);
}

ssize_t __wrap_write(int descriptor, const void *bytes, size_t size) {
    if (descriptor != panelDescriptor)
        return __real_write(descriptor, bytes, size);
    ++world().writesTried;
    if (!world().lineTakesBytes) {
        errno = EAGAIN;
        return -1;
    }
    const std::string text(static_cast<const char *>(bytes), size);
    const bool isCommand = std::exchange(world().commandFollows, text == "\xFE");
    if (!isCommand && !world().commandFollows && world().onText)
        world().onText(text);
    for (const char byte : text)
        world().display.receive(static_cast<unsigned char>(byte));
    world().sent += text;
    world().writes.push_back(size);
    if (size == 16)
        world().events.emplace_back("row");
    return static_cast<ssize_t>(size);
}

int __wrap_poll(pollfd *descriptors, nfds_t count, int timeout) {
    if (descriptors->fd != panelDescriptor)
        return __real_poll(descriptors, count, timeout);
    EXPECT_TRUE(count == 1 && descriptors->events == POLLIN && timeout == 500);
    if (world().duringPoll) {
        once(world().duringPoll);
        errno = EINTR;
        return -1;
    }
    if (world().answers.empty() || world().answers.front().empty()) {
        if (!world().answers.empty())
            world().answers.pop_front();
        world().microseconds += pollTimeout;
        return 0;
    }
    world().microseconds += answerTime;
    return 1;
}

ssize_t __wrap_read(int descriptor, void *buffer, size_t size) {
    if (descriptor != panelDescriptor)
        return __real_read(descriptor, buffer, size);
    EXPECT_EQ(size, 255U);
    const std::string answer = world().answers.front();
    world().answers.pop_front();
    return static_cast<ssize_t>(answer.copy(static_cast<char *>(buffer), size));
}

int __wrap_usleep(useconds_t duration) {
    world().microseconds += duration;
    if (duration != turnPause)
        world().pauses.push_back(std::to_string(duration / 1'000'000) + " s " + world().shown());
    once(world().duringPause);
    return 0;
}

int __wrap_gettimeofday(timeval *now, void *) {
    world().events.emplace_back("clock");
    if (!world().clockWorks)
        return -1;
    now->tv_sec = world().microseconds / 1'000'000;
    now->tv_usec = world().microseconds % 1'000'000;
    return 0;
}

int __wrap_system(const char *command) {
    if (startsWith(command, "stty ")) {
        world().settings.emplace_back(command);
    } else {
        world().events.push_back(std::string("start ") + command);
        world().scripts.push_back(command + (" behind " + world().shown()));
    }
    return 0;
}

FILE *__wrap_popen(const char *command, const char *mode) {
    EXPECT_STREQ(mode, "r");
    if (!world().shellWorks)
        return nullptr;
    world().events.push_back(std::string("run ") + command);
    if (startsWith(command, applyScript))
        world().scripts.push_back(command + (" behind " + world().shown()));
    once(world().duringCommand);
    return openContents(world().run(command));
}

int __wrap_pclose(FILE *pipe) {
    return fclose(pipe);
}

// The standard library's file streams are opened inside it, out of the linker's reach, by this.
FILE *fopen64(const char *path, const char *mode) {
    using Open = FILE *(*)(const char *, const char *);
    static const auto realOpen = reinterpret_cast<Open>(dlsym(RTLD_NEXT, "fopen64"));
    const std::string name = path;
    if (!startsWith(name, "/etc/") && !startsWith(name, "/opt/kestrova/")) {
        return realOpen(path, mode);
    }
    world().events.push_back("open " + name);
    const auto file = world().files.find(name);
    return file == world().files.end() ? nullptr : openContents(file->second);
}

} // extern "C"
// NOLINTEND(bugprone-reserved-identifier,readability-inconsistent-declaration-parameter-name)
