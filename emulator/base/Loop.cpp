#include "emulator/base/Loop.h"

#include <utility>

namespace emulator {

Loop::Loop(Handler itsAfterEvent) : afterEvent(std::move(itsAfterEvent)) {}

void Loop::wakeAt(std::optional<TimePoint> time) {
    if (time == wake)
        return;
    wake = time;
    timer.cancel();
    if (!wake)
        return;
    timer.expires_at(*wake);
    timer.async_wait([this](const boost::system::error_code &error) {
        if (error)
            return;
        wake.reset();
        afterEvent();
    });
}

void Loop::onSignals(const std::vector<int> &numbers, std::function<void(int)> handler) {
    for (const int number : numbers)
        signals.add(number);
    onSignal = std::move(handler);
    awaitSignal();
}

void Loop::awaitSignal() {
    signals.async_wait([this](const boost::system::error_code &error, int number) {
        if (error)
            return;
        awaitSignal();
        onSignal(number);
        afterEvent();
    });
}

Readable::Readable(Loop &itsLoop, int itsDescriptor, Loop::Handler onReadable)
    : loop(itsLoop), descriptor(loop.asio(), itsDescriptor), handler(std::move(onReadable)) {
    await();
}

Readable::~Readable() {
    descriptor.release();
}

void Readable::pause(bool shallPause) {
    isPaused = shallPause;
    if (!isPaused)
        await();
}

void Readable::await() {
    if (std::exchange(isAwaiting, true))
        return;
    descriptor.async_wait(boost::asio::posix::stream_descriptor::wait_read,
                          [this](const boost::system::error_code &error) {
                              if (error) // also when this object is gone
                                  return;
                              isAwaiting = false;
                              if (isPaused)
                                  return;
                              await();
                              // Kept, because the handler may destroy this object.
                              const Loop &itsLoop = loop;
                              const Loop::Handler call = handler;
                              call();
                              itsLoop.afterEvent();
                          });
}

} // namespace emulator
