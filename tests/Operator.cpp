#include "Operator.h"

#include <iostream>
#include <sys/wait.h>
#include <unistd.h>

bool holdsInFreshProgram(const std::function<void()> &check) {
    std::cout.flush();
    const pid_t child = fork();
    if (child == 0) {
        check();
        std::cout.flush();
        fflush(stdout);
        _exit(testing::Test::HasFailure() ? EXIT_FAILURE : EXIT_SUCCESS);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return status == 0;
}

void standardAppliance() {
    world().appliance.files["/etc/ma-platform"] = "q75-b\n";
    world().appliance.ports["eth0"] = "10.1.1.5/8";
}

void Operator::poll() {
    loop->turn();
}

void Operator::poll(emulator::Key key) {
    world().keypad.press(key);
    loop->turn();
    world().keypad.release();
}

void Operator::answer(const std::string &bytes) {
    world().unread += bytes;
    loop->turn();
}

void Operator::hold(emulator::Key key, int polls) {
    for (int k = 0; k < polls; ++k)
        poll(key);
    answer("?"); // garbled: a release that takes no time
}

void Operator::press(emulator::Key key, int times) {
    for (int k = 0; k < times; ++k)
        hold(key, 1);
}

void Operator::wait(double seconds) {
    const Micros end = world().now + Micros(static_cast<long long>(seconds * 1e6));
    while (world().now < end)
        poll();
}
