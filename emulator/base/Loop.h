#pragma once

#include "emulator/base/Clock.h"

#include <boost/asio/io_context.hpp>
#include <boost/asio/posix/stream_descriptor.hpp>
#include <boost/asio/signal_set.hpp>
#include <boost/asio/steady_timer.hpp>

#include <functional>
#include <optional>
#include <utility>
#include <vector>

namespace emulator {

/// The one place where the emulator waits: for descriptors, signals and a time. There is one
/// thread; events are handled one after the other, and after each the emulator takes its turn.
class Loop {
  public:
    using Handler = std::function<void()>;

    /// `afterEvent` is called after everything that has happened, and when `wakeAt` has come.
    explicit Loop(Handler afterEvent);

    /// Waits for events and handles them until `stop`. Exceptions of a handler leave this function.
    void run() { context.run(); }
    void stop() { context.stop(); }

    /// The next time at which to take a turn even if nothing happens, if any.
    void wakeAt(std::optional<TimePoint> time);
    /// Calls `handler` with each of these signals from now on.
    void onSignals(const std::vector<int> &numbers, std::function<void(int)> handler);

    /// For what waits for more than a descriptor's readability; its handlers are to be made with
    /// `turnAfter`.
    boost::asio::io_context &asio() { return context; }
    /// A completion handler that calls `handle`, after which the emulator takes its turn.
    template <typename Handle> auto turnAfter(Handle handle) {
        return [this, handle = std::move(handle)](auto &&...results) mutable {
            handle(std::forward<decltype(results)>(results)...);
            afterEvent();
        };
    }

  private:
    friend class Readable;

    void awaitSignal();

    boost::asio::io_context context{1};
    Handler afterEvent;
    boost::asio::steady_timer timer{context};
    std::optional<TimePoint> wake;
    boost::asio::signal_set signals{context};
    std::function<void(int)> onSignal;
};

/// Calls a handler whenever a descriptor that somebody else owns can be read, or has come to its
/// end. To be destroyed before the descriptor is closed.
class Readable {
  public:
    Readable(Loop &loop, int descriptor, Loop::Handler onReadable);
    Readable(const Readable &) = delete;
    Readable &operator=(const Readable &) = delete;
    ~Readable();

    /// While paused, the handler is not called.
    void pause(bool shallPause);

  private:
    void await();

    Loop &loop;
    boost::asio::posix::stream_descriptor descriptor;
    Loop::Handler handler;
    bool isPaused = false;
    bool isAwaiting = false;
};

} // namespace emulator
