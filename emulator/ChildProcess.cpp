#include "ChildProcess.h"

#include "Clock.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <system_error>
#include <thread>

namespace emulator {

namespace {

constexpr std::chrono::seconds gracePeriod{2};
constexpr std::chrono::milliseconds groupLook{10};
constexpr int cannotRun = 127;

[[noreturn]] void become(std::vector<std::string> &command, int output, pid_t parent) {
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    // The emulator may have gone before it was asked to tell of its end.
    if (getppid() != parent)
        _exit(cannotRun);
    setpgid(0, 0);
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
    if (output >= 0) {
        dup2(output, STDOUT_FILENO);
        dup2(output, STDERR_FILENO);
    }
    std::vector<char *> argv;
    for (std::string &word : command)
        argv.push_back(word.data());
    argv.push_back(nullptr);
    execvp(argv[0], argv.data());
    dprintf(STDERR_FILENO, "panel-emulator: cannot run %s: %s\n", argv[0], strerror(errno));
    _exit(cannotRun);
}

} // namespace

ChildProcess::ChildProcess(std::vector<std::string> command, int output) : pid_(-1) {
    const pid_t parent = getpid();
    pid_ = fork();
    if (pid_ < 0)
        throw std::system_error(errno, std::generic_category(), "cannot start a process");
    if (pid_ == 0)
        become(command, output, parent);
    setpgid(pid_, pid_); // as the child does: whoever comes first, the group exists from here on
    // By number: the C library's header for it does not serve C++.
    end_ = FileDescriptor(static_cast<int>(syscall(SYS_pidfd_open, pid_, 0)));
}

ChildProcess::~ChildProcess() {
    const TimePoint giveUp = Clock::now() + gracePeriod;
    kill(-pid_, SIGTERM);
    pollfd end{end_.get(), POLLIN, 0};
    if (!status())
        poll(&end, 1, static_cast<int>(std::chrono::milliseconds(gracePeriod).count()));
    // What the command had started may end a little later than the command itself.
    while (status() && kill(-pid_, 0) == 0 && Clock::now() < giveUp)
        std::this_thread::sleep_for(groupLook);
    kill(-pid_, SIGKILL);
    if (!status_)
        waitpid(pid_, nullptr, 0);
}

std::optional<int> ChildProcess::status() {
    int raw = 0;
    if (!status_ && waitpid(pid_, &raw, WNOHANG) == pid_)
        status_ = WIFEXITED(raw) ? WEXITSTATUS(raw) : 128 + WTERMSIG(raw);
    return status_;
}

} // namespace emulator
