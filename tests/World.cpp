#include "World.h"

#include <algorithm>
#include <gtest/gtest.h>

#include <cerrno>
#include <cstdio>
#include <dlfcn.h>
#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/time.h>
#include <unistd.h>

using namespace std::chrono_literals;

World &world() {
    static auto *const theWorld = new World;
    return *theWorld;
}

namespace {

constexpr int panelDescriptor = 4242;
constexpr Micros pollTimeout = 500ms, answerTime = 25ms, turnPause = 100ms;

// Opens a file for a library, but none that the machine has for itself.
FILE *openForLibrary(const char *function, const char *path, const char *mode) {
    const char *byHand = getenv("PANEL_JOURNEY");
    const std::vector<std::string> ownPlaces{SOURCE "/", testing::TempDir(), "/proc/self/",
                                             byHand == nullptr ? SOURCE "/" : byHand};
    if (std::none_of(ownPlaces.begin(), ownPlaces.end(),
                     [&](const std::string &place) { return boost::starts_with(path, place); })) {
        ADD_FAILURE() << "the machine's own file would be read: " << path;
        errno = ENOENT;
        return nullptr;
    }
    using Open = FILE *(*)(const char *, const char *);
    return reinterpret_cast<Open>(dlsym(RTLD_NEXT, function))(path, mode);
}

FILE *openContents(const std::string &contents) {
    FILE *file = fdopen(memfd_create("contents", 0), "w+");
    fwrite(contents.data(), 1, contents.length(), file);
    fseek(file, 0, SEEK_SET);
    return file;
}

// Of this file nothing more can be read.
FILE *openBeginning(const std::string &beginning) {
    static std::string unreadBeginning;
    unreadBeginning = beginning;
    const auto readOnce = [](void *, char *buffer, size_t size) -> ssize_t {
        const std::string text = std::exchange(unreadBeginning, "");
        return text.empty() ? -1 : static_cast<ssize_t>(text.copy(buffer, size));
    };
    return fopencookie(nullptr, "r", {readOnce, nullptr, nullptr, nullptr});
}

int interrupted() {
    errno = EINTR;
    return -1;
}

const std::set<std::string> knownFiles = {"/etc/ma-platform", "/etc/network/interfaces",
                                          "/etc/resolv.conf", "/opt/kestrova/seq.site_conn",
                                          "/opt/kestrova/config/nis.config"};

} // namespace

void World::pass(Micros time, bool forAnswer) {
    const Micros end = now + time;
    const auto isOver = [&] { return hasSignalled || (forAnswer && !unread.empty()); };
    for (look(); !isOver() && now < end; look())
        now = std::min(end, wakeAt());
}

void World::passWhole(Micros time) {
    for (const Micros end = now + time; now < end;) {
        hasSignalled = false;
        pass(end - now);
    }
}

// The linker directs the calls of the program, and only those, to these functions and dictates
// their names.
// NOLINTBEGIN(bugprone-reserved-identifier,readability-inconsistent-declaration-parameter-name)
extern "C" {

FILE *__real_fopen(const char *path, const char *mode);
ssize_t __real_read(int descriptor, void *buffer, size_t size);
ssize_t __real_write(int descriptor, const void *bytes, size_t size);

int __wrap_open(const char *path, int flags, ...) {
    EXPECT_STREQ(path, "/dev/ttyS1");
    EXPECT_EQ(flags, O_RDWR | O_NONBLOCK);
    return panelDescriptor;
}

ssize_t __wrap_write(int descriptor, const void *bytes, size_t size) {
    if (descriptor != panelDescriptor)
        return __real_write(descriptor, bytes, size);
    World &w = world();
    w.writesTried++;
    if (!w.lineTakesBytes) {
        errno = EAGAIN;
        return -1;
    }
    const std::string text(static_cast<const char *>(bytes), size);
    const bool isCommand = std::exchange(w.commandFollows, text == "\xFE");
    if (!isCommand && !w.commandFollows && w.display.cursorColumn() + static_cast<int>(size) > 40)
        w.overruns++;
    w.sent += text;
    w.writes.push_back(size);
    if (size == 16)
        w.events.emplace_back("row");
    for (const char byte : text) {
        if (w.display.receive(static_cast<unsigned char>(byte)))
            w.keypad.request(w.unread.empty());
        w.look();
    }
    return static_cast<ssize_t>(size);
}

int __wrap_poll(pollfd *descriptors, nfds_t count, int timeout) {
    EXPECT_TRUE(count == 1 && descriptors->fd == panelDescriptor && descriptors->events == POLLIN &&
                timeout == pollTimeout / 1ms);
    World &w = world();
    w.hasSignalled = false;
    const Micros end = w.now + pollTimeout;
    w.pass(pollTimeout, true);
    if (!w.unread.empty())
        w.pass(std::min(answerTime, end - w.now));
    if (w.hasSignalled)
        return interrupted();
    return !w.unread.empty() && w.now < end ? 1 : 0;
}

ssize_t __wrap_read(int descriptor, void *buffer, size_t size) {
    if (descriptor != panelDescriptor)
        return __real_read(descriptor, buffer, size);
    EXPECT_EQ(size, 255U);
    EXPECT_NE(world().unread, "") << "read without an answer";
    world().reads++;
    const std::string &answers = world().lastRead = std::exchange(world().unread, "");
    return static_cast<ssize_t>(answers.copy(static_cast<char *>(buffer), size));
}

int __wrap_usleep(useconds_t duration) {
    World &w = world();
    w.hasSignalled = false;
    if (Micros(duration) != turnPause)
        w.pauses.push_back({std::to_string(duration / 1000) + " ms", w.display});
    w.pass(Micros(duration));
    return w.hasSignalled ? interrupted() : 0;
}

int __wrap_gettimeofday(timeval *now, void *) {
    world().events.emplace_back("clock");
    if (!world().clockWorks)
        return -1;
    now->tv_sec = world().now / 1s;
    now->tv_usec = (world().now % 1s).count();
    return 0;
}

int __wrap_system(const char *command) {
    world().events.push_back(std::string("start ") + command);
    if (!boost::starts_with(command, "stty ")) // by which the line is configured
        world().runs.push_back({command, world().display});
    return 0;
}

FILE *__wrap_popen(const char *command, const char *mode) {
    EXPECT_STREQ(mode, "r");
    World &w = world();
    if (!w.shellWorks)
        return nullptr;
    w.events.push_back(std::string("run ") + command);
    const Appliance::Words arguments = scriptArguments(command);
    if (!arguments.empty())
        w.runs.push_back({command, w.display});
    if (arguments.empty() || w.appliance.fact(std::string("prints ") + command)) {
        const std::string output = w.appliance.output(command);
        w.passWhole(w.commandTime);
        return openContents(output);
    }
    const std::string talk = w.appliance.fact("script") == "chatters" ? "Reloading\n" : "";
    w.passWhole(w.appliance.scriptTime());
    return openContents(talk + std::to_string(w.appliance.runScript(arguments)) + "\n");
}

int __wrap_pclose(FILE *pipe) {
    return fclose(pipe);
}

FILE *__wrap_fopen(const char *path, const char *mode) {
    EXPECT_STREQ(mode, "r");
    EXPECT_TRUE(knownFiles.count(path)) << "a file that no appliance knows: " << path;
    world().events.push_back(std::string("open ") + path);
    if (world().directories.count(path))
        return __real_fopen(SOURCE "/", mode);
    const auto file = world().appliance.fact(std::string("file ") + path);
    if (file && world().cutFiles.count(path))
        return openBeginning(*file);
    return file ? openContents(*file) : nullptr;
}

// The linker cannot redirect the calls that a library makes for the program. Which of these two
// opens a file stream depends on the standard library's version.
FILE *fopen(const char *path, const char *mode) {
    return openForLibrary("fopen", path, mode);
}
FILE *fopen64(const char *path, const char *mode) {
    return openForLibrary("fopen64", path, mode);
}

} // extern "C"
// NOLINTEND(bugprone-reserved-identifier,readability-inconsistent-declaration-parameter-name)
