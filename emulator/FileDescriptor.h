#pragma once

#include <unistd.h>

#include <utility>

namespace emulator {

/// Owns a file descriptor and closes it.
class FileDescriptor {
  public:
    FileDescriptor() = default;
    explicit FileDescriptor(int fd) : fd_(fd) {}
    FileDescriptor(FileDescriptor &&other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    FileDescriptor &operator=(FileDescriptor &&other) noexcept {
        std::swap(fd_, other.fd_);
        return *this;
    }
    FileDescriptor(const FileDescriptor &) = delete;
    FileDescriptor &operator=(const FileDescriptor &) = delete;
    ~FileDescriptor() { reset(); }

    /// The descriptor, or -1 (which poll passes over).
    [[nodiscard]] int get() const { return fd_; }
    void reset() {
        if (fd_ >= 0)
            close(std::exchange(fd_, -1));
    }

  private:
    int fd_ = -1;
};

} // namespace emulator
