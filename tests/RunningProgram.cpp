#include "RunningProgram.h"

#include <iostream>
#include <sys/wait.h>
#include <unistd.h>

bool holdsInFreshProgram(const std::function<void()> &check) {
    std::cout.flush();
    const pid_t child = fork();
    if (child == 0) {
        [&]() noexcept { check(); }(); // what it throws ends this process, and is not caught here
        std::cout.flush();
        fflush(stdout);
        _exit(testing::Test::HasFailure() ? EXIT_FAILURE : EXIT_SUCCESS);
    }
    int status = 0;
    waitpid(child, &status, 0);
    return status == 0;
}

void standardAppliance() {
    world().appliance.act({"hostname", "monitor"});
    world().appliance.act({"file", "/etc/ma-platform", "q75-b\n"});
    world().appliance.act({"port", "eth0", "10.1.1.5/8"});
}
