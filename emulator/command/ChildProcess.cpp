#include "emulator/command/ChildProcess.h"

#include "emulator/base/complain.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <ctime>
#include <fstream>
#include <set>
#include <system_error>

namespace emulator {

namespace {

constexpr std::chrono::seconds gracePeriod{2};
constexpr std::chrono::seconds killPeriod{1};
constexpr timespec endingLook{0, 10'000'000}; // how often to see whether all have ended
constexpr int cannotRun = 127;

int shellStatus(int raw) {
    return WIFEXITED(raw) ? WEXITSTATUS(raw) : 128 + WTERMSIG(raw);
}

// Makes the kernel send SIGTERM to this process when `parent` has ended.
void endWith(pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    // The parent may have ended before this request.
    if (getppid() != parent)
        _exit(cannotRun);
}

[[noreturn]] void become(std::vector<std::string> &command, pid_t guard) {
    endWith(guard);
    setpgid(0, 0);
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    std::vector<char *> argv;
    argv.reserve(command.size() + 1);
    for (std::string &word : command)
        argv.push_back(word.data());
    argv.push_back(nullptr);
    execvp(argv[0], argv.data());
    complain("cannot run " + command.front() + ": " + strerror(errno));
    _exit(cannotRun);
}

FileDescriptor openProcess(pid_t pid) {
    // By its number, because the C library's header for it cannot be used in C++.
    return FileDescriptor(static_cast<int>(syscall(SYS_pidfd_open, pid, 0)));
}

// Sends a signal to this process's children, and says which they are. What has left the command's
// group becomes one of them when its parent ends.
std::set<pid_t> signalChildren(int number, const std::set<pid_t> &except) {
    std::set<pid_t> all;
    std::ifstream children("/proc/thread-self/children");
    for (pid_t child = 0; children >> child;) {
        all.insert(child);
        if (except.count(child) == 0)
            kill(child, number);
    }
    return all;
}

// Waits until the command and whatever it has started have ended, and ends them at SIGTERM as far
// as possible: a process that has become root cannot be killed.
int waitForAll(pid_t command, const sigset_t &awaited) {
    std::optional<int> status;
    std::optional<TimePoint> giveUp;
    std::set<pid_t> told; // to end
    for (;;) {
        const int signal =
            giveUp ? sigtimedwait(&awaited, nullptr, &endingLook) : sigwaitinfo(&awaited, nullptr);
        int raw = 0;
        pid_t ended = 0;
        while ((ended = waitpid(-1, &raw, WNOHANG)) > 0)
            if (ended == command)
                status = shellStatus(raw);
        const bool isNoneLeft = ended < 0; // no child, not even an adopted one
        if (status && isNoneLeft)
            return *status;
        if (!giveUp && (signal == SIGTERM || status)) {
            kill(-command, SIGTERM);
            told.insert(command);
            giveUp = Clock::now() + gracePeriod;
        }
        if (giveUp && Clock::now() < *giveUp) {
            told = signalChildren(SIGTERM, told);
        } else if (giveUp) {
            kill(-command, SIGKILL);
            signalChildren(SIGKILL, {});
        }
        if (giveUp && Clock::now() >= *giveUp + killPeriod)
            kill(getpid(), SIGKILL); // which tells the emulator
    }
}

[[noreturn]] void guardCommand(std::vector<std::string> &command, int output, int report,
                               pid_t parent) {
    // Nothing but SIGKILL ends the guard before the command. The signals are blocked before
    // anything else, so that no request to end the command gets lost.
    sigset_t all;
    sigfillset(&all);
    sigprocmask(SIG_BLOCK, &all, nullptr);
    // Otherwise the emulator's handlers would swallow a signal that comes before the command
    // starts.
    for (int number = 1; number < NSIG; number++)
        signal(number, SIG_DFL);
    endWith(parent);
    setsid(); // a background group of the terminal would be stopped when it reads or writes there
    prctl(PR_SET_CHILD_SUBREAPER, 1); // so that orphans become children of this process
    dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
    if (output >= 0) {
        dup2(output, STDOUT_FILENO);
        dup2(output, STDERR_FILENO);
    }
    const pid_t self = getpid();
    const pid_t pid = fork();
    if (pid == 0)
        become(command, self);
    if (pid > 0)
        setpgid(pid, pid); // as the command does too, so that the group exists from here on
    if (write(report, &pid, sizeof pid) < 0 || pid < 0)
        _exit(cannotRun);
    // The line must hang up with the emulator, not with the guard.
    close_range(STDERR_FILENO + 1, ~0U, 0);
    sigset_t awaited;
    sigemptyset(&awaited);
    sigaddset(&awaited, SIGCHLD);
    sigaddset(&awaited, SIGTERM);
    _exit(waitForAll(pid, awaited));
}

} // namespace

ChildProcess::ChildProcess(Loop &loop, std::vector<std::string> words, int output) {
    std::array<int, 2> ends{};
    if (pipe2(ends.data(), O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "cannot open a pipe");
    const FileDescriptor pidReport(ends[0]);
    FileDescriptor report(ends[1]);
    const pid_t self = getpid();
    guard = fork();
    if (guard == 0)
        guardCommand(words, output, report.get(), self);
    report.reset();
    ssize_t count = 0;
    do
        count = read(pidReport.get(), &command, sizeof command);
    while (count < 0 && errno == EINTR); // as when the terminal's size changes
    if (guard < 0 || count != sizeof command || command < 0)
        throw std::system_error(errno, std::generic_category(), "cannot start a process");
    commandEnd = openProcess(command);
    guardEnd = openProcess(guard);
    guardEndWait = std::make_unique<Readable>(loop, guardEnd.get(), [this] { status(); });
}

ChildProcess::~ChildProcess() {
    end();
}

void ChildProcess::end() {
    if (!status())
        kill(guard, SIGTERM);
}

std::optional<int> ChildProcess::status() {
    int raw = 0;
    if (!result && waitpid(guard, &raw, WNOHANG) == guard) {
        result = shellStatus(raw);
        guardEndWait.reset();
        if (WIFSIGNALED(raw))
            endWithoutGuard();
    }
    return result;
}

// The guard has given up, or somebody has killed it.
void ChildProcess::endWithoutGuard() {
    kill(-command, SIGKILL);
    pollfd end{commandEnd.get(), POLLIN, 0};
    isCommandLeft =
        poll(&end, 1, static_cast<int>(std::chrono::milliseconds(killPeriod).count())) == 0;
}

} // namespace emulator
