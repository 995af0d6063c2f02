#include "runtime/SerialLine.h"

#include <cstdlib>
#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace {

constexpr const char *device = "/dev/ttyS1";
constexpr int exitLineNotConfigured = 150;

// A raw line at 2400 baud: 8 data bits, no parity, two stop bits, no flow control, no translation.
constexpr std::array settings = {
    "stty ispeed 2400 < /dev/ttyS1",
    "stty raw < /dev/ttyS1",
    "stty -F /dev/ttyS1 -ignbrk -brkint -parmrk -inpck -istrip -inlcr -igncr -icrnl -iuclc -ixon"
    " -ixany -ixoff -imaxbel ignpar",
    "stty -F /dev/ttyS1 -opost -olcuc -onlcr -ocrnl -onocr -onlret -ofill -ofdel nl0 cr0 tab0 bs0"
    " vt0 ff0",
    "stty -F /dev/ttyS1 -parenb -crtscts -parodd -hupcl cread cs8 cstopb clocal",
    "stty -F /dev/ttyS1 -isig -icanon -iexten -echo noflsh",
};

void configure() {
    for (const char *command : settings) {
        if (system(command) != 0)
            exit(exitLineNotConfigured);
    }
}

} // namespace

SerialLine::SerialLine() : fd(open(device, O_RDWR | O_NONBLOCK)) {
    configure();
}

SerialLine::~SerialLine() {
    close(fd);
}

ssize_t SerialLine::send(const void *bytes, std::size_t length) {
    return write(fd, bytes, length);
}

SerialLine::Received SerialLine::receive(std::chrono::milliseconds timeout) {
    Received bytes{};
    pollfd line{fd, POLLIN, 0};
    if (poll(&line, 1, static_cast<int>(timeout.count())) > 0) {
        [[maybe_unused]] const ssize_t count = read(fd, bytes.data(), bytes.size() - 1);
    }
    return bytes;
}
